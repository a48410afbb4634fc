#pragma once

#include <cstdint>

#include "pencommon/IPenMorphable.h"
#include "pencommon/Pen.h"

namespace Qelt {

class Pencil2OutlineDrawableGL;
class Pencil2PredictionDrawableGL;
class Pencil2PreviewDrawableGL;
class Pencil2StrokeDrawableGL;
struct Pencil2Data;

// The pencil: settings, and the drawables that draw by them. Main thread. A drawable is made on the first
// demand and lives until the pen dies; stroke and outline drawables are replaced sooner, by their getter,
// once the rendering version has changed.
class Pencil2 final : public Pen, public IPenMorphable {
 public:
  Pencil2();
  ~Pencil2() override;

  float GetMinSize() override;  // stroke units
  float GetMaxSize() override;
  bool GetPenAttribute(IPen::PenAttribute attribute) override;
  // Each null when memory ran out.
  PenStrokeDrawableGL* GetStrokeDrawableGL() override;
  IPenPredictionDrawableGL* GetPredictionStrokeDrawableGL() override;
  PenOutlineDrawableGL* GetOutlineDrawableGL() override;
  PenPreviewDrawableGL* GetPreviewDrawableGL() override;
  IPenMorphable* GetMorphable() override;
  // The data manager's queue; without a data manager the last one seen.
  IGLMsgQueue* GetMsgQueue() override;

  // Options take effect with the next event a drawable handles. Setters always return true.
  bool SetCurveEnabled(bool enabled) override;
  bool IsCurveEnabled() override;
  bool SetFixedWidthEnabled(bool enabled) override;
  bool IsFixedWidthEnabled() override;
  bool SetFixedWidth(float width) override;
  float GetFixedWidth() override;

 private:
  void releasePenData();
  // The record. If memory ran out for it before, it is made now; null when memory runs out again.
  Pencil2Data* record();

  Pencil2StrokeDrawableGL* mStrokeDrawable = nullptr;
  Pencil2PredictionDrawableGL* mPredictionDrawable = nullptr;
  Pencil2OutlineDrawableGL* mOutlineDrawable = nullptr;
  Pencil2PreviewDrawableGL* mPreviewDrawable = nullptr;
  [[maybe_unused]] void* mSpareDrawable = nullptr;  // Kept: never filled
  Pencil2Data* mData = nullptr;                     // see `record`
  std::int32_t mStrokeVersion = -1;                 // that the stroke drawable was made for
  std::int32_t mOutlineVersion = -1;                // that the outline drawable was made for
  IGLMsgQueue* mMsgQueue = nullptr;                 // last one the data manager gave
};

}  // namespace Qelt

// The entry point of the library: makes one pencil. Returns null when memory ran out. The caller owns the pen
// and deletes it through its virtual destructor, on the main thread. Exported.
extern "C" __attribute__((visibility("default"))) Qelt::Pen* createPenInst();
