#include "pen/DrawableFactory.h"

#include "outline/Pencil2OutlineDrawableGLV1.h"
#include "outline/Pencil2OutlineDrawableGLV2.h"
#include "outline/Pencil2OutlineDrawableGLV3.h"
#include "outline/Pencil2OutlineDrawableGLV4.h"
#include "outline/Pencil2OutlineDrawableGLV5.h"
#include "pen/WholeDrawable.h"
#include "stroke/Pencil2StrokeDrawableGLV1.h"
#include "stroke/Pencil2StrokeDrawableGLV2.h"
#include "stroke/Pencil2StrokeDrawableGLV3.h"
#include "stroke/Pencil2StrokeDrawableGLV4.h"
#include "stroke/Pencil2StrokeDrawableGLV5.h"
#include "stroke/Pencil2StrokeDrawableGLV7.h"
#include "stroke/Pencil2StrokeDrawableGLV8.h"

namespace Qelt {

Pencil2StrokeDrawableGL* createStrokeDrawable(std::int32_t strokeVersion, Pencil2Data* penData,
                                              PenGLDataManager* manager) {
  switch (strokeVersion) {
    case 2:
      return makeWhole<Pencil2StrokeDrawableGLV2>(penData, manager);
    case 3:
      return makeWhole<Pencil2StrokeDrawableGLV3>(penData, manager);
    case 4:
    case 6:
      return makeWhole<Pencil2StrokeDrawableGLV4>(penData, manager);
    case 5:
      return makeWhole<Pencil2StrokeDrawableGLV5>(penData, manager);
    case 7:
      return makeWhole<Pencil2StrokeDrawableGLV7>(penData, manager);
    case 8:
      return makeWhole<Pencil2StrokeDrawableGLV8>(penData, manager);
    default:
      return makeWhole<Pencil2StrokeDrawableGLV1>(penData, manager);
  }
}

Pencil2OutlineDrawableGL* createOutlineDrawable(std::int32_t outlineVersion, Pencil2Data* penData,
                                                PenGLDataManager* manager) {
  switch (outlineVersion) {
    case 2:
      return makeWhole<Pencil2OutlineDrawableGLV2>(penData, manager);
    case 3:
      return makeWhole<Pencil2OutlineDrawableGLV3>(penData, manager);
    case 4:
      return makeWhole<Pencil2OutlineDrawableGLV4>(penData, manager);
    case 5:
      return makeWhole<Pencil2OutlineDrawableGLV5>(penData, manager);
    default:
      return makeWhole<Pencil2OutlineDrawableGLV1>(penData, manager);
  }
}

}  // namespace Qelt
