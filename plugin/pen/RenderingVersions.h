#pragma once

#include <array>
#include <cstdint>

// The one list of versions. The plug-in's version table and factory, the tests, the benchmarks and the
// program take theirs from it, so a new version begins with a row here; the compiler then names what is
// missing. This header depends on nothing, so that programs without the plug-in's other headers may read it.
namespace Qelt {

// What a pen of one rendering version draws with. A released row is frozen, since documents store the number.
// What the row names is checked where the drawables are made, in DrawableFactory.cpp.
struct RenderingVersion {
  std::int32_t number;         // as documents store it and Pen::getVersion returns it
  std::int32_t strokeVersion;  // of the stroke drawable
  // The stroke version whose class draws it: strokeVersion itself, but 4 for rendering version 6.
  std::int32_t drawnBy;
  std::int32_t outlineVersion;  // of the outline drawable
  int floatsPerVertex;          // in the batches of the stroke drawable: 9, or 11 with a smoothed rim
  bool predicts;                // whether the pen offers a predicted continuation
};

// Ascending, without gaps, from 1. The columns are the fields above, in their order.
inline constexpr std::array<RenderingVersion, 8> kRenderingVersions{{
    {1, 1, 1, 1, 9, false},
    {2, 2, 2, 2, 9, false},
    {3, 3, 3, 3, 9, false},
    {4, 4, 4, 4, 9, false},
    {5, 5, 5, 5, 9, false},
    {6, 6, 4, 4, 9, false},
    {7, 7, 7, 4, 9, false},
    {8, 8, 8, 4, 11, true},
}};

// Floats in a vertex of the batches of the other drawables, which are the same in all rendering versions.
inline constexpr int kOutlineFloatsPerVertex = 7;
inline constexpr int kPreviewFloatsPerVertex = 9;
inline constexpr int kPredictionFloatsPerVertex = 11;

}  // namespace Qelt
