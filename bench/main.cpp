#include <benchmark/benchmark.h>
#include <malloc.h>

#include <algorithm>
#include <cstdio>
#include <cstring>
#include <map>
#include <string>
#include <vector>

#include "RecordedInk.h"
#include "pen/RenderingVersions.h"

// Runs all benchmarks once and prints the ratios that count; machines differ, ratios within one run hardly.
namespace {

class RatioReporter : public benchmark::ConsoleReporter {
 public:
  void ReportRuns(const std::vector<Run>& runs) override {
    ConsoleReporter::ReportRuns(runs);
    for (const auto& run : runs) {
      if (run.run_type != Run::RT_Iteration) continue;
      // A stamp's cost where there is one, else a call's; the counter is in nanoseconds already.
      const auto counter = run.counters.find("ns/stamp");
      const double cost =
          counter != run.counters.end()
              ? static_cast<double>(counter->second.value)
              : run.GetAdjustedRealTime() / benchmark::GetTimeUnitMultiplier(run.time_unit) * 1e9;
      // Other programs only ever add: the fastest repetition is the truest.
      const auto known = mNanoseconds.try_emplace(run.run_name.str(), cost).first;
      known->second = std::min(known->second, cost);
    }
  }

  void printRatio(const char* what, const char* name, const char* base) const {
    const auto over = mNanoseconds.find(name);
    const auto under = mNanoseconds.find(base);
    if (over == mNanoseconds.end() || under == mNanoseconds.end()) return;
    std::printf("%-10s %-28s / %-26s = %8.4f  (%.1f / %.1f ns)\n", what, name, base,
                over->second / under->second, over->second, under->second);
  }

 private:
  std::map<std::string, double> mNanoseconds;
};

}  // namespace

int main(int argc, char** argv) {
  // Freed memory is kept: to give it back to the system and take it anew, page by page, costs several times
  // what the pen does with it, and the C library does so in one run and not in the next.
  mallopt(M_MMAP_THRESHOLD, 1 << 30);
  mallopt(M_TRIM_THRESHOLD, 1 << 30);
  // Short repetitions, mixed, so that what disturbs them disturbs all alike; later options win.
  char repetitions[] = "--benchmark_repetitions=9";
  char interleaving[] = "--benchmark_enable_random_interleaving=true";
  char shortRuns[] = "--benchmark_min_time=0.05";
  std::vector<char*> rest = {argv[0], repetitions, interleaving, shortRuns};
  for (int i = 1; i < argc; ++i) {
    if (std::strncmp(argv[i], "--ink=", 6) == 0) {
      QeltBench::inkPath() = argv[i] + 6;
    } else {
      rest.push_back(argv[i]);
    }
  }
  int count = static_cast<int>(rest.size());
  benchmark::Initialize(&count, rest.data());
  if (benchmark::ReportUnrecognizedArguments(count, rest.data())) return 2;
  RatioReporter reporter;
  benchmark::RunSpecifiedBenchmarks(&reporter);

  std::printf("\n");
  for (const char* drawable : {"RTV3", "RTV1", "RTV2", "preview", "prediction", "outline"}) {
    reporter.printRatio("(b)/(a)", ("b/AddPoint_" + std::string(drawable)).c_str(), "a/append_prepared");
  }
  reporter.printRatio("(d)/(c)", "d/live_move_V/8/manual_time", "c/cheap_walk");
  // What was not run is not printed.
  for (const Qelt::RenderingVersion& version : Qelt::kRenderingVersions) {
    const std::string number = std::to_string(version.number);
    reporter.printRatio("(d)/(a)", ("d/live_move_V/" + number + "/manual_time").c_str(), "a/append_prepared");
    reporter.printRatio("whole/(a)", ("outline_V/" + number).c_str(), "a/append_prepared");
  }
  for (const char* whole : {"preview", "prediction"}) {
    reporter.printRatio("whole/(a)", whole, "a/append_prepared");
  }
  reporter.printRatio("cache", "redraw/cached/1000", "redraw/computed/1000");
  reporter.printRatio("cache", "redraw/page_2000_cached/1", "redraw/page_2000_computed/0");
  return 0;
}
