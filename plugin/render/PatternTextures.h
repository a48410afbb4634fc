#pragma once

namespace Qelt {

class IGLMsgQueue;
class ISPBitmap;

// The two pattern textures of a render drawable. Render thread.
class PatternTextures {
 public:
  // What masks the stamps.
  enum class PointSource {
    StampShapes,  // the three round shapes
    // Kept: the prediction masks its stamps with squares of paper grain, the first 10,000 bytes of it in rows
    // of 100, in every tile.
    PaperGrain,
  };

  // Creates the bitmaps that do not exist yet, the grain of the given size. `owner` names the drawable in the
  // bitmaps' debug names.
  void build(IGLMsgQueue* queue, int width, int height, const char* owner);

  // Uploads the pixels; of the grain the first width x height, in rows of `width`. False when a bitmap is
  // missing or memory ran out: the upload is left where it is, and `ready` as it was.
  bool upload(int width, int height, PointSource points);

  // Kept: the fields go on holding the released bitmaps, so that a later `build` creates nothing. From then
  // on they are never used again.
  void release();

  // True after an upload, until the release.
  bool ready() const { return mState == State::Filled; }
  bool isReleased() const { return mState == State::Released; }

  // Only while `ready`.
  void bindGrain(int unit) const;
  void bindPoints(int unit) const;

 private:
  enum class State { Blank, Filled, Released };

  ISPBitmap* mPatternsTexture = nullptr;
  ISPBitmap* mPointTexture = nullptr;
  State mState = State::Blank;
};

}  // namespace Qelt
