#include "pencommon/IPenMorphable.h"
#include "pencommon/PenDrawableRT.h"
#include "pencommon/PenGLDataManager.h"
#include "pencommon/PenManager.h"
#include "pencommon/PenStrokeDrawableGL.h"

namespace Qelt {

const char* const PenManager::QELT_PENCIL2_NAME = "QeltPencil2";

IPenMorphable::~IPenMorphable() = default;
IPenListRedrawable::~IPenListRedrawable() = default;
IReferenceBitmapSettable::~IReferenceBitmapSettable() = default;
IDepthMapBitmapSettable::~IDepthMapBitmapSettable() = default;
PenGLDataManager::~PenGLDataManager() = default;

}  // namespace Qelt
