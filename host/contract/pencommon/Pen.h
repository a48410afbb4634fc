#pragma once

#include "base/HostApi.h"
#include "base/PointF.h"
#include "base/RectF.h"
#include "base/String.h"
#include "pencommon/IPen.h"
#include "pencommon/PenSettingData.h"

namespace Qelt {

class IGLMsgQueue;
class IPenMorphable;
class IPenPredictionDrawableGL;
class PenGLDataManager;
class PenOutlineDrawableGL;
class PenPreviewDrawableGL;
class PenStrokeDrawableGL;

// The base of every pen: settings and the record drawables read them from. Main thread. The virtual
// operations are the pen's slots, in this order; a pen overrides what it does its own way. A drawable that
// a getter returns belongs to the pen.
class QELT_HOST_API Pen : public IPen {
 public:
  Pen();
  virtual ~Pen();
  Pen(const Pen&) = delete;
  Pen& operator=(const Pen&) = delete;

  virtual void SetSize(float size);  // stroke units
  virtual float GetSize();
  virtual float GetMinSize();
  virtual float GetMaxSize();
  virtual void SetColor(int argb);
  virtual int GetColor();
  virtual void SetScreenResolution(int width, int height);  // pixels
  virtual void SetAdvancedSetting(const String* setting);   // copied
  virtual const String* GetAdvancedSetting();               // borrowed
  virtual void SetParticleDensity(int density);
  virtual int GetParticleDensity();
  virtual void SetParticleSize(float size);
  virtual float GetParticleSize();
  virtual void SetRenderingLevel(int level);
  virtual int GetRenderingLevel();
  virtual void SetEnhancedAntiAlias(bool enabled);
  virtual bool GetPenAttribute(IPen::PenAttribute attribute);
  virtual PenStrokeDrawableGL* GetStrokeDrawableGL();
  virtual IPenPredictionDrawableGL* GetPredictionStrokeDrawableGL();
  virtual PenOutlineDrawableGL* GetOutlineDrawableGL();
  virtual PenPreviewDrawableGL* GetPreviewDrawableGL();
  virtual void* GetTestDrawableGL();
  virtual void* GetWetDryable();
  virtual IPenMorphable* GetMorphable();
  virtual IGLMsgQueue* GetMsgQueue();
  // Chosen here: the growth of the points' box by the widest stamp; times and names are not read.
  virtual RectF GetStrokeRect(PointF* points, float* pressures, long* times, int count, float size,
                              bool curve, String* name);
  // Borrowed until replaced; null takes it away.
  virtual void setPenDataManager(PenGLDataManager* manager);

  // The rendering version that strokes are drawn with from now on. Chosen here: the setter.
  int getVersion() const;
  void setVersion(int renderingVersion);

 protected:
  // The pen's own record; lives as long as the pen.
  PenSettingData* getSettingData();
  PenGLDataManager* getPenDataManager() const;

 private:
  PenSettingData mSettingData;
  String mAdvancedSetting;
  PenGLDataManager* mDataManager = nullptr;
  int mVersion = 0;
};

}  // namespace Qelt
