#include "render/PatternTextures.h"

#include <GLES3/gl3.h>

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <iterator>
#include <memory>
#include <new>

#include "graphics/ISPBitmap.h"
#include "graphics/SPGraphicsFactory.h"

namespace Qelt {
namespace {

constexpr int kTileSide = 100;
constexpr int kTiles = 3;
constexpr int kTilePixels = kTileSide * kTileSide;

ISPBitmap* createPattern(IGLMsgQueue* queue, int width, int height, const char* owner, const char* name) {
  ISPBitmap* bitmap = SPGraphicsFactory::CreateBitmap(queue, width, height, nullptr, false, 0);
  if (bitmap == nullptr) return nullptr;
  bitmap->GetTexture()->SetFilter(ISPTexture::kMinFilter, GL_NEAREST);
  bitmap->GetTexture()->SetFilter(ISPTexture::kMagFilter, GL_NEAREST);
  char debugName[128];
  std::snprintf(debugName, sizeof debugName, "%s::buildTextures %s", owner, name);
  bitmap->SetDebugName(debugName);
  return bitmap;
}

using Pixels = std::unique_ptr<std::uint32_t[]>;

Pixels allocatePixels(std::size_t count) {
  return Pixels(new (std::nothrow) std::uint32_t[count]);
}

}  // namespace

void PatternTextures::buildTextures(IGLMsgQueue* queue, const char* owner) {
  if (mPatternsTexture == nullptr) {
    mPatternsTexture = createPattern(queue, kGrainSide, kGrainSide, owner, "mPatternsTexture");
    if (mPatternsTexture != nullptr) {
      mPatternsTexture->GetTexture()->SetParameter(GL_TEXTURE_WRAP_S, GL_REPEAT);
      mPatternsTexture->GetTexture()->SetParameter(GL_TEXTURE_WRAP_T, GL_REPEAT);
    }
  }
  if (mPointTexture == nullptr) {
    mPointTexture = createPattern(queue, kTileSide, kTiles * kTileSide, owner, "mPointTexture");
  }
}

bool PatternTextures::setTextures(PointSource points) {
  // A pattern byte becomes a word: red in memory, the other channels 0.
  Pixels grain = allocatePixels(sizeof g_backgroundPtn);
  if (grain == nullptr) return false;
  std::copy(std::begin(g_backgroundPtn), std::end(g_backgroundPtn), grain.get());
  if (mPatternsTexture != nullptr) mPatternsTexture->SetPixels(grain.get(), kGrainSide, kGrainSide);
  grain.reset();

  Pixels shapes = allocatePixels(sizeof g_pointPtn);
  if (shapes == nullptr) return false;
  for (int i = 0; i < kTiles * kTilePixels; ++i) {
    shapes[i] = points == PointSource::StampShapes ? g_pointPtn[i] : g_backgroundPtn[i % kTilePixels];
  }
  if (mPointTexture != nullptr) mPointTexture->SetPixels(shapes.get(), kTileSide, kTiles * kTileSide);
  return mPatternsTexture != nullptr && mPointTexture != nullptr;
}

void PatternTextures::releaseTextures() {
  SPGraphicsFactory::ReleaseBitmap(mPatternsTexture);
  SPGraphicsFactory::ReleaseBitmap(mPointTexture);
}

void PatternTextures::bindGrain(int unit) const {
  mPatternsTexture->GetTexture()->Bind(unit);
}

void PatternTextures::bindPoints(int unit) const {
  mPointTexture->GetTexture()->Bind(unit);
}

}  // namespace Qelt
