#pragma once

#include <cstdint>

namespace Qelt {

class PenGLDataManager;
class Pencil2OutlineDrawableGL;
class Pencil2StrokeDrawableGL;
struct Pencil2Data;

// Makes the drawables of a version. Main thread. The caller owns what comes back; null when memory ran out.

// Version 6 is drawn by version 4; unknown versions by version 1.
Pencil2StrokeDrawableGL* createStrokeDrawable(std::int32_t strokeVersion, Pencil2Data* penData,
                                              PenGLDataManager* manager);

// Unknown versions by version 1.
Pencil2OutlineDrawableGL* createOutlineDrawable(std::int32_t outlineVersion, Pencil2Data* penData,
                                                PenGLDataManager* manager);

}  // namespace Qelt
