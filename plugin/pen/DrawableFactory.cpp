#include "pen/DrawableFactory.h"

#include <new>
#include <tuple>
#include <utility>

#include "outline/OutlineDrawables.h"
#include "prediction/Pencil2PredictionDrawableGL.h"
#include "preview/Pencil2PreviewDrawableGL.h"
#include "stroke/StrokeDrawables.h"

constexpr std::int32_t versionTable[Qelt::kVersionRows][2] = {{0, 0}, {1, 1}, {2, 2}, {3, 3}, {4, 4},
                                                              {5, 5}, {6, 4}, {7, 4}, {8, 4}};

namespace Qelt {
namespace {

template <typename Drawable>
Drawable* makeWhole(Pencil2Data* penData, PenGLDataManager* manager) {
  if (penData == nullptr) return nullptr;
  auto* made = new (std::nothrow) Drawable(penData, manager);
  if (made == nullptr || made->hasRenderDrawable()) return made;
  delete made;
  return nullptr;
}

// The drawables of one kind, of all versions.
template <typename Base, typename List>
struct Kind;

template <typename Base, typename... Drawables>
struct Kind<Base, std::tuple<Drawables...>> {
  static Base* make(std::int32_t version, Pencil2Data* penData, PenGLDataManager* manager) {
    static_assert(has(1), "version 1 draws all versions that are not listed");
    Base* made = nullptr;
    if (!(makeIf<Drawables>(version, penData, manager, &made) || ...)) {
      static_cast<void>((makeIf<Drawables>(1, penData, manager, &made) || ...));
    }
    return made;
  }

  // False when the version is another class's.
  template <typename Drawable>
  static bool makeIf(std::int32_t version, Pencil2Data* penData, PenGLDataManager* manager, Base** made) {
    if (version != Drawable::Row::number) return false;
    *made = makeWhole<Drawable>(penData, manager);
    return true;
  }

  static constexpr bool has(std::int32_t version) { return ((Drawables::Row::number == version) || ...); }

  static constexpr int floatsPerVertex(std::int32_t version) {
    int floats = 0;
    ((Drawables::Row::number == version
          ? void(floats = static_cast<int>(Drawables::RenderDrawable::kFloatsPerVertex))
          : void()),
     ...);
    return floats;
  }

  // Whether some rendering version asks for each of them; `column` holds the version that it asks for.
  static constexpr bool areAllListed(std::int32_t RenderingVersion::*column) {
    const auto isListed = [column](std::int32_t number) {
      for (const RenderingVersion& version : kRenderingVersions) {
        if (version.*column == number) return true;
      }
      return false;
    };
    return (isListed(Drawables::Row::number) && ...);
  }
};

using Strokes = Kind<Pencil2StrokeDrawableGL, StrokeDrawables>;
using Outlines = Kind<Pencil2OutlineDrawableGL, OutlineDrawables>;

// --- What a new version may forget ---

// The compiler shows which row it checks.
template <RenderingVersion Row, std::size_t Index>
constexpr bool isComplete() {
  static_assert(Row.number == static_cast<std::int32_t>(Index) + 1,
                "RenderingVersions.h: numbers ascend from 1 without gaps");
  static_assert(Strokes::has(Row.drawnBy),
                "no stroke drawable for this rendering version: write its row in StrokeVersions.h, and its "
                "class in StrokeDrawables.h, with the instantiation in StrokeDrawables.cpp");
  static_assert(Outlines::has(Row.outlineVersion),
                "no outline drawable for this rendering version: write its row in OutlineVersions.h, and its "
                "class in OutlineDrawables.h, with the instantiation in OutlineDrawables.cpp");
  static_assert(Strokes::floatsPerVertex(Row.drawnBy) == Row.floatsPerVertex,
                "RenderingVersions.h: floatsPerVertex is not what the stroke's render drawable writes");
  static_assert(
      versionTable[Row.number][0] == Row.strokeVersion && versionTable[Row.number][1] == Row.outlineVersion,
      "versionTable, in DrawableFactory.cpp, differs from RenderingVersions.h");
  return true;
}

static_assert([]<std::size_t... Index>(std::index_sequence<Index...>) {
  return (isComplete<kRenderingVersions[Index], Index>() && ...);
}(std::make_index_sequence<kRenderingVersions.size()>()));

static_assert(Strokes::areAllListed(&RenderingVersion::drawnBy),
              "a class of StrokeDrawables.h draws no version: add it to RenderingVersions.h");
static_assert(Outlines::areAllListed(&RenderingVersion::outlineVersion),
              "a class of OutlineDrawables.h draws no version: add it to RenderingVersions.h");

static_assert(Outlines::floatsPerVertex(1) == kOutlineFloatsPerVertex &&
              Pencil2PreviewDrawableRT::kFloatsPerVertex == kPreviewFloatsPerVertex &&
              Pencil2PredictionDrawableRT::kFloatsPerVertex == kPredictionFloatsPerVertex);

}  // namespace

Pencil2StrokeDrawableGL* createStrokeDrawable(std::int32_t strokeVersion, Pencil2Data* penData,
                                              PenGLDataManager* manager) {
  std::int32_t drawnBy = 1;
  for (const RenderingVersion& version : kRenderingVersions) {
    if (version.strokeVersion == strokeVersion) drawnBy = version.drawnBy;
  }
  return Strokes::make(drawnBy, penData, manager);
}

Pencil2OutlineDrawableGL* createOutlineDrawable(std::int32_t outlineVersion, Pencil2Data* penData,
                                                PenGLDataManager* manager) {
  return Outlines::make(outlineVersion, penData, manager);
}

Pencil2PreviewDrawableGL* createPreviewDrawable(Pencil2Data* penData, PenGLDataManager* manager) {
  return makeWhole<Pencil2PreviewDrawableGL>(penData, manager);
}

Pencil2PredictionDrawableGL* createPredictionDrawable(Pencil2Data* penData, PenGLDataManager* manager) {
  return makeWhole<Pencil2PredictionDrawableGL>(penData, manager);
}

}  // namespace Qelt
