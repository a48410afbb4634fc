#include "play/PenSession.h"

#include "desktop/gl/RenderQueue.h"
#include "pencommon/IPenMorphable.h"
#include "text/Refusal.h"

namespace QeltDesktop {
namespace {

// A screen on which the pens' speed scale is 1, in pixels.
constexpr int kScreenWidth = 1440;
constexpr int kScreenHeight = 2560;

}  // namespace

PenStyle styleFor(const Brush& brush, const PenStyle& own, const Options& options) {
  PenStyle style = own;
  if (brush.width) style.size = *brush.width;
  if (brush.rgb) style.argb = 0xFF000000u | *brush.rgb;
  if (brush.transparency) {
    style.argb = (style.argb & 0x00FFFFFFu) | static_cast<std::uint32_t>(255 - *brush.transparency) << 24;
  }
  if (options.size) style.size = *options.size;
  if (options.argb) style.argb = *options.argb;
  return style;
}

int renderingVersionFor(const Brush& brush, const Options& options) {
  if (options.renderingVersion) return *options.renderingVersion;
  return brush.renderingVersion.value_or(kUsualRenderingVersion);
}

bool curveFor(const Brush& brush, const Options& options) {
  return options.curve ? *options.curve : brush.curve.value_or(kUsualCurve);
}

std::optional<OutlineOptions> outlineFor(const Brush& brush, const Options& options) {
  if (options.outline) return options.outline;
  if (!brush.outlineSize) return std::nullopt;
  return OutlineOptions{*brush.outlineSize, brush.outlineArgb.value_or(0xFF000000u)};
}

PenKind penKindFor(const Brush& brush, const Options& options) {
  return {renderingVersionFor(brush, options), curveFor(brush, options)};
}

PenSession::PenSession(const PluginLibrary& plugin, RenderQueue& queue, const PenKind& kind)
    : mQueue(queue), mDataManager(&queue), mPen(plugin.createPen()), mOwnStyle{} {
  if (!mPen) throw Refusal(plugin.path() + ": the plug-in makes no pen");
  mPen->setPenDataManager(&mDataManager);
  mPen->SetScreenResolution(kScreenWidth, kScreenHeight);
  mPen->setVersion(kind.renderingVersion);
  mOwnStyle = {mPen->GetSize(), static_cast<std::uint32_t>(mPen->GetColor())};
  Qelt::IPenMorphable* const morphable = mPen->GetMorphable();
  if (morphable != nullptr) morphable->SetCurveEnabled(kind.curve);
}

PenSession::~PenSession() {
  mPen.reset();
  mQueue.finish();
}

void PenSession::setStyle(const PenStyle& style) {
  mPen->SetSize(style.size);
  mPen->SetColor(static_cast<int>(style.argb));
}

PenSet::PenSet(const PluginLibrary& plugin, RenderQueue& queue, const Page& page, const Options& options) {
  for (const Stroke& stroke : page.strokes) {
    const PenKind kind = penKindFor(stroke.brush, options);
    std::unique_ptr<PenSession>& session = mSessions[kind];
    if (!session) session = std::make_unique<PenSession>(plugin, queue, kind);
  }
}

}  // namespace QeltDesktop
