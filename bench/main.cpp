#include <benchmark/benchmark.h>

#include <algorithm>
#include <cstdio>
#include <cstring>
#include <exception>
#include <map>
#include <string>
#include <vector>

#include "EventBench.h"

// Runs all benchmarks once and prints the ratios that count; machines differ, ratios within one run hardly.
namespace {

class RatioReporter : public benchmark::ConsoleReporter {
 public:
  void ReportRuns(const std::vector<Run>& runs) override {
    ConsoleReporter::ReportRuns(runs);
    for (const auto& run : runs) {
      const auto found = run.counters.find("ns/stamp");
      // A rate's inverse, in units of 1e-9 s already.
      if (found == run.counters.end() || run.run_type != Run::RT_Iteration) continue;
      // Other programs only ever add: the fastest repetition is the truest.
      const auto known = mNanoseconds.try_emplace(run.run_name.str(), found->second.value).first;
      known->second = std::min(known->second, static_cast<double>(found->second.value));
    }
  }

  void printRatio(const char* what, const char* name, const char* base) const {
    const auto over = mNanoseconds.find(name);
    const auto under = mNanoseconds.find(base);
    if (over == mNanoseconds.end() || under == mNanoseconds.end()) return;
    std::printf("%-10s %-24s / %-18s = %.2f  (%.1f / %.1f ns a stamp)\n", what, name, base,
                over->second / under->second, over->second, under->second);
  }

 private:
  std::map<std::string, double> mNanoseconds;
};

}  // namespace

int main(int argc, char** argv) {
  std::string ink = QELT_SAMPLE_INK;
  // Short repetitions, mixed, so that what disturbs them disturbs all alike; later options win.
  char repetitions[] = "--benchmark_repetitions=9";
  char interleaving[] = "--benchmark_enable_random_interleaving=true";
  char shortRuns[] = "--benchmark_min_time=0.05";
  std::vector<char*> rest = {argv[0], repetitions, interleaving, shortRuns};
  for (int i = 1; i < argc; ++i) {
    if (std::strncmp(argv[i], "--ink=", 6) == 0) {
      ink = argv[i] + 6;
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
  reporter.printRatio("(b)/(a)", "b/AddPoint_RTV3", "a/append_prepared");
  reporter.printRatio("(b)/(a)", "b/AddPoint_RTV1", "a/append_prepared");
  reporter.printRatio("(b)/(a)", "b/AddPoint_RTV2", "a/append_prepared");
  reporter.printRatio("(d)/(c)", "d/live_move_V/8/manual_time", "c/cheap_walk");
  for (const char* version : {"1", "2", "3", "4", "5", "7"}) {
    reporter.printRatio("others", ("d/live_move_V/" + std::string(version) + "/manual_time").c_str(),
                        "a/append_prepared");
  }
  try {
    QeltBench::reportEvents(ink);
    QeltBench::reportLongStroke();
  } catch (const std::exception& error) {
    std::fprintf(stderr, "%s\n", error.what());
    return 1;
  }
  return 0;
}
