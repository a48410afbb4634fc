#include "commands/Info.h"

#include <dlfcn.h>
#include <link.h>

#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <span>
#include <string>

#include "commands/ProgramFiles.h"
#include "desktop/engine/PluginLibrary.h"
#include "desktop/gl/RenderQueue.h"
#include "output/Terminal.h"
#include "pen/RenderingVersions.h"
#include "play/PenSession.h"
#include "text/Refusal.h"

namespace QeltDesktop {
namespace {

// A row of the plug-in's version table.
struct TableRow {
  std::int32_t strokeVersion, outlineVersion;
};

// The table as the loaded plug-in exports it, which may be of another age than this program. The index is
// the rendering version.
std::span<const TableRow> versionTable(const PluginLibrary& plugin) {
  const void* const table = plugin.symbol("versionTable");
  Dl_info where{};
  const ElfW(Sym)* symbol = nullptr;
  if (table == nullptr ||
      dladdr1(table, &where, reinterpret_cast<void**>(const_cast<ElfW(Sym)**>(&symbol)), RTLD_DL_SYMENT) ==
          0 ||
      symbol == nullptr) {
    throw Refusal(plugin.path() + ": the plug-in has no versionTable");
  }
  return {static_cast<const TableRow*>(table), symbol->st_size / sizeof(TableRow)};
}

// Where the plug-in's table and this program's list of versions disagree, one line for each version.
std::string disagreements(std::span<const TableRow> table) {
  std::string lines;
  const auto tell = [&](std::size_t number, const char* what) {
    lines += "rendering version " + std::to_string(number) + what + '\n';
  };
  const std::size_t known = Qelt::kRenderingVersions.size();
  for (const Qelt::RenderingVersion& version : Qelt::kRenderingVersions) {
    const auto number = static_cast<std::size_t>(version.number);
    if (number >= table.size()) {
      tell(number, " is known to this program, not to the plug-in");
    } else if (table[number].strokeVersion != version.strokeVersion ||
               table[number].outlineVersion != version.outlineVersion) {
      tell(number, (" has stroke version " + std::to_string(version.strokeVersion) + " and outline version " +
                    std::to_string(version.outlineVersion) + " in this program's list")
                       .c_str());
    }
  }
  for (std::size_t number = known + 1; number < table.size(); ++number) {
    tell(number, " is known to the plug-in, not to this program");
  }
  return lines;
}

}  // namespace

void info(const Options& options) {
  const PluginLibrary plugin(pluginPath(options));
  std::printf("plug-in      %s\n", printable(plugin.path()).c_str());
  const std::span<const TableRow> table = versionTable(plugin);

  RenderQueue queue(RenderQueue::Mode::Thread, RenderQueue::GL::Context);
  std::printf("GL renderer  %s\n", queue.rendererName().c_str());

  PenSession session(plugin, queue, {kUsualRenderingVersion, kUsualCurve});
  const PenStyle& style = session.ownStyle();
  std::printf("pen size     %g to %g, a new pen has %g\n", static_cast<double>(session.pen().GetMinSize()),
              static_cast<double>(session.pen().GetMaxSize()), static_cast<double>(style.size));
  std::printf("pen colour   #%08X\n", static_cast<unsigned int>(style.argb));
  std::printf("\nrendering version  stroke version  outline version\n");
  for (std::size_t version = 0; version < table.size(); ++version) {
    std::printf("%17zu  %14d  %15d\n", version, table[version].strokeVersion, table[version].outlineVersion);
  }
  if (const std::string lines = disagreements(table); !lines.empty()) {
    std::printf("\nThe plug-in is of another age than this program:\n%s", lines.c_str());
  }
  finishStandardOutput();
}

}  // namespace QeltDesktop
