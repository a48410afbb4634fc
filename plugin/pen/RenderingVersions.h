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
  std::int32_t number;          // as documents store it and Pen::getVersion returns it
  std::int32_t strokeVersion;   // of the stroke drawable
  std::int32_t drawnBy;         // the stroke version whose class draws it: the same, but for 6, drawn by 4's
  std::int32_t outlineVersion;  // of the outline drawable
  int floatsPerVertex;          // in the batches of the stroke drawable: 9, or 11 with a smoothed rim
  bool predicts;                // whether the pen offers a predicted continuation
};

// Ascending, without gaps, from 1.
inline constexpr std::array<RenderingVersion, 8> kRenderingVersions{{
    {.number = 1,
     .strokeVersion = 1,
     .drawnBy = 1,
     .outlineVersion = 1,
     .floatsPerVertex = 9,
     .predicts = false},
    {.number = 2,
     .strokeVersion = 2,
     .drawnBy = 2,
     .outlineVersion = 2,
     .floatsPerVertex = 9,
     .predicts = false},
    {.number = 3,
     .strokeVersion = 3,
     .drawnBy = 3,
     .outlineVersion = 3,
     .floatsPerVertex = 9,
     .predicts = false},
    {.number = 4,
     .strokeVersion = 4,
     .drawnBy = 4,
     .outlineVersion = 4,
     .floatsPerVertex = 9,
     .predicts = false},
    {.number = 5,
     .strokeVersion = 5,
     .drawnBy = 5,
     .outlineVersion = 5,
     .floatsPerVertex = 9,
     .predicts = false},
    {.number = 6,
     .strokeVersion = 6,
     .drawnBy = 4,
     .outlineVersion = 4,
     .floatsPerVertex = 9,
     .predicts = false},
    {.number = 7,
     .strokeVersion = 7,
     .drawnBy = 7,
     .outlineVersion = 4,
     .floatsPerVertex = 9,
     .predicts = false},
    {.number = 8,
     .strokeVersion = 8,
     .drawnBy = 8,
     .outlineVersion = 4,
     .floatsPerVertex = 11,
     .predicts = true},
}};

// Floats in a vertex of the batches of the other drawables, which are the same in all rendering versions.
inline constexpr int kOutlineFloatsPerVertex = 7;
inline constexpr int kPreviewFloatsPerVertex = 9;
inline constexpr int kPredictionFloatsPerVertex = 11;

}  // namespace Qelt
