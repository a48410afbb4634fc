#include "support/LiveStroke.h"

#include <stdexcept>

#include "desktop/engine/PluginLibrary.h"
#include "pencommon/IPenMorphable.h"

namespace QeltTests {

namespace {

BoardOptions boardFor(const LiveStrokeOptions& wanted) {
  const int side = wanted.picture ? 256 : 0;
  return {.version = wanted.renderingVersion, .width = side, .height = side, .thread = wanted.picture};
}

}  // namespace

LiveStroke::LiveStroke(const LiveStrokeOptions& wanted) : Board(boardFor(wanted)) {
  static const QeltDesktop::PluginLibrary library(QELT_PLUGIN_PATH);
  mPen.reset(library.createPen());
  if (mPen == nullptr) throw std::runtime_error("no pen");
  mPen->setPenDataManager(&data);
  mPen->setVersion(options.version);
  mPen->SetSize(options.size);
  mPen->SetColor(static_cast<int>(options.color));
  mPen->GetMorphable()->SetCurveEnabled(options.curve);
  mDrawable = mPen->GetStrokeDrawableGL();
  if (mDrawable == nullptr) throw std::runtime_error("no stroke drawable");
  mDrawable->SetCanvas(&canvas);
  watch();
}

LiveStroke::~LiveStroke() {
  unwatch();
  deletePen();
}

void LiveStroke::deletePen() {
  mDrawable = nullptr;
  mPen.reset();
  queue.finish();
}

bool LiveStroke::draw(const Qelt::MotionEvent& event) {
  const bool drawn = mDrawable->Draw(&event, &rect);
  queue.finish();
  return drawn;
}

}  // namespace QeltTests
