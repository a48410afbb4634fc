#include "render/PatternTextures.h"

#include <GLES3/gl3.h>

#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <memory>
#include <new>

#include "graphics/ISPBitmap.h"
#include "graphics/SPGraphicsFactory.h"
#include "render/Patterns.h"

namespace Qelt {
namespace {

constexpr int kTileSide = 100;
constexpr int kTiles = 3;
constexpr int kTilePixels = kTileSide * kTileSide;
constexpr int kGrainSide = 150;

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

void PatternTextures::build(IGLMsgQueue* queue, int width, int height, const char* owner) {
  if (isReleased()) return;
  if (mPatternsTexture == nullptr) {
    mPatternsTexture = createPattern(queue, width, height, owner, "mPatternsTexture");
    if (mPatternsTexture != nullptr) {
      mPatternsTexture->GetTexture()->SetParameter(GL_TEXTURE_WRAP_S, GL_REPEAT);
      mPatternsTexture->GetTexture()->SetParameter(GL_TEXTURE_WRAP_T, GL_REPEAT);
    }
  }
  if (mPointTexture == nullptr) {
    mPointTexture = createPattern(queue, kTileSide, kTiles * kTileSide, owner, "mPointTexture");
  }
}

bool PatternTextures::upload(int width, int height, PointSource points) {
  if (isReleased() || width < 0 || height < 0 || width > kGrainSide || height > kGrainSide) return true;
  const int grainPixels = width * height;
  // A pattern byte becomes a word: red in memory, the other channels 0.
  Pixels grain = allocatePixels(static_cast<std::size_t>(grainPixels));
  if (grain == nullptr) return false;
  for (int i = 0; i < grainPixels; ++i) grain[i] = g_backgroundPtn[i];
  if (mPatternsTexture != nullptr) mPatternsTexture->SetPixels(grain.get(), width, height);
  grain.reset();

  Pixels shapes = allocatePixels(static_cast<std::size_t>(kTiles) * kTilePixels);
  if (shapes == nullptr) return false;
  for (int i = 0; i < kTiles * kTilePixels; ++i) {
    shapes[i] = points == PointSource::StampShapes ? g_pointPtn[i] : g_backgroundPtn[i % kTilePixels];
  }
  if (mPointTexture != nullptr) mPointTexture->SetPixels(shapes.get(), kTileSide, kTiles * kTileSide);
  if (mPatternsTexture == nullptr || mPointTexture == nullptr) return false;
  mState = State::Filled;
  return true;
}

void PatternTextures::release() {
  if (isReleased()) return;
  SPGraphicsFactory::ReleaseBitmap(mPatternsTexture);
  SPGraphicsFactory::ReleaseBitmap(mPointTexture);
  mState = State::Released;
}

void PatternTextures::bindGrain(int unit) const {
  mPatternsTexture->GetTexture()->Bind(unit);
}

void PatternTextures::bindPoints(int unit) const {
  mPointTexture->GetTexture()->Bind(unit);
}

}  // namespace Qelt
