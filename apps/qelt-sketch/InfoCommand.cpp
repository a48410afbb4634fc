#include <cstdint>
#include <cstdio>
#include <memory>

#include "Commands.h"
#include "PenSession.h"
#include "ProgramFiles.h"
#include "Refusal.h"
#include "StandardOutput.h"
#include "desktop/engine/PluginLibrary.h"
#include "desktop/gl/RenderQueue.h"

namespace QeltDesktop {
namespace {

constexpr int kVersionRows = 9;
using VersionRow = const std::int32_t[2];  // stroke version, outline version

}  // namespace

void infoCommand(const Options& options) {
  const PluginLibrary plugin(pluginPath(options));
  std::printf("plug-in      %s\n", printable(plugin.path()).c_str());
  const auto* const table = static_cast<VersionRow*>(plugin.symbol("versionTable"));
  if (table == nullptr) throw Refusal(plugin.path() + ": the plug-in has no versionTable");

  RenderQueue queue(RenderQueue::Mode::Thread, RenderQueue::GL::Context);
  std::printf("GL renderer  %s\n", queue.rendererName().c_str());

  PenSession session(plugin, queue, options);
  const PenStyle& style = session.ownStyle();
  std::printf("pen size     %g to %g, a new pen has %g\n", static_cast<double>(session.pen().GetMinSize()),
              static_cast<double>(session.pen().GetMaxSize()), static_cast<double>(style.size));
  std::printf("pen colour   #%08X\n", static_cast<unsigned int>(style.argb));
  std::printf("\nrendering version  stroke version  outline version\n");
  for (int version = 0; version < kVersionRows; ++version) {
    std::printf("%17d  %14d  %15d\n", version, table[version][0], table[version][1]);
  }
  finishStandardOutput();
}

}  // namespace QeltDesktop
