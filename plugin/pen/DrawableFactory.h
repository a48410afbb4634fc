#pragma once

#include <cstddef>
#include <cstdint>

#include "pen/RenderingVersions.h"

namespace Qelt {

class PenGLDataManager;
class Pencil2OutlineDrawableGL;
class Pencil2PredictionDrawableGL;
class Pencil2PreviewDrawableGL;
class Pencil2StrokeDrawableGL;
struct Pencil2Data;

inline constexpr std::size_t kVersionRows = kRenderingVersions.size() + 1;

// The row of `versionTable` for a pen's rendering version: those that are listed have their own. Kept: all
// others, 0 among them, take row 1.
inline int versionRow(std::int32_t renderingVersion) {
  return static_cast<std::uint32_t>(renderingVersion) - 1u < kRenderingVersions.size() ? renderingVersion : 1;
}

// What a pen of that rendering version draws with, by the same rule.
inline const RenderingVersion& renderingVersionOf(std::int32_t number) {
  return kRenderingVersions[static_cast<std::size_t>(versionRow(number) - 1)];
}

// The makers of drawables. Each drawable is made together with its render drawable, or not at all: without
// one it would never draw, while a getter that returned null tries again. Main thread. The caller owns what
// is returned; null when memory ran out, and for a pen without a record.

// Versions that are not listed are drawn by version 1.
Pencil2StrokeDrawableGL* createStrokeDrawable(std::int32_t strokeVersion, Pencil2Data* penData,
                                              PenGLDataManager* manager);
Pencil2OutlineDrawableGL* createOutlineDrawable(std::int32_t outlineVersion, Pencil2Data* penData,
                                                PenGLDataManager* manager);
Pencil2PreviewDrawableGL* createPreviewDrawable(Pencil2Data* penData, PenGLDataManager* manager);
Pencil2PredictionDrawableGL* createPredictionDrawable(Pencil2Data* penData, PenGLDataManager* manager);

}  // namespace Qelt

// For each rendering version: the version of the stroke drawable, then that of the outline drawable.
// Exported. Row 0 is never selected, see Qelt::versionRow.
extern "C" __attribute__((visibility("default"))) const std::int32_t versionTable[Qelt::kVersionRows][2];
