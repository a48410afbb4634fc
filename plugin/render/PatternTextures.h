#pragma once

namespace Qelt {

class IGLMsgQueue;
class ISPBitmap;

// The two patterns of the pencil, one byte per pixel, row by row from the top, no header. Only read; live as
// long as the library. The host and the shaders see them as the red channel of a texture.
//
// The bytes come from the pictures in resources/ when the build is configured (cmake/EmbedPatterns.cmake);
// how those are made, and the statistics they keep, stands in docs/grain.md.

// The paper grain: one picture of 150 x 150, values 2 to 243. High is a peak of the paper, which takes the
// graphite; low is a pit, which stays white. Its edges meet without a seam.
extern const unsigned char g_backgroundPtn[22500] __attribute__((visibility("default")));

// Three round stamp shapes of 100 x 100, one after another: a flat core, a grainy rim, 0 outside the circle.
// The shaders draw where a byte is not 0.
extern const unsigned char g_pointPtn[30000] __attribute__((visibility("default")));

// The two patterns as textures, of one render drawable. Call buildTextures and setTextures before the first
// drawing, both again when the GL context was restored, and releaseTextures once at the end. Render thread.
class PatternTextures {
 public:
  static constexpr int kGrainSide = 150;  // pixels

  // What masks the stamps.
  enum class PointSource {
    StampShapes,  // the three round shapes
    // Kept: the prediction masks its stamps with a square of paper grain: the grain's first 10,000 bytes, in
    // rows of 100, in place of each of the three shapes.
    PaperGrain,
  };

  // Creates the bitmaps that do not exist yet. `owner` names the render drawable in their debug names.
  void buildTextures(IGLMsgQueue* queue, const char* owner);

  // Uploads the pixels. Returns false if a bitmap is missing or memory ran out, with what was uploaded before
  // that left in place.
  bool setTextures(PointSource points);

  // Kept: the fields go on holding the released bitmaps. Nothing else may be called from then on.
  void releaseTextures();

  // Only after a setTextures that returned true.
  void bindGrain(int unit) const;
  void bindPoints(int unit) const;

 private:
  ISPBitmap* mPatternsTexture = nullptr;
  ISPBitmap* mPointTexture = nullptr;
};

}  // namespace Qelt
