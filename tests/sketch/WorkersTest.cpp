#include "commands/Workers.h"

#include <gtest/gtest.h>
#include <unistd.h>

#include <csignal>
#include <cstddef>
#include <functional>
#include <map>
#include <string>

#include "text/Refusal.h"

namespace QeltDesktop {
namespace {

// How jobs 0 to `jobs` - 1 ended, each once: "" when done.
std::map<std::size_t, std::string> ends(std::size_t jobs, std::size_t workers,
                                        const std::function<Job()>& make) {
  std::map<std::size_t, std::string> all;
  doInWorkers(jobs, workers, make, [&](const JobEnd& end) {
    EXPECT_TRUE(all.emplace(end.index, end.refusal.value_or("")).second) << end.index;
  });
  EXPECT_EQ(all.size(), jobs);
  return all;
}

TEST(Workers, DoEachJobOnceWhateverOthersDo) {
  for (const std::size_t workers : {1u, 3u, 40u}) {
    auto all = ends(20, workers, [] {
      return [](std::size_t index) {
        if (index % 5 == 1) throw Refusal("page " + std::to_string(index) + std::string(100'000, '.'));
        if (index == 7 || index == 19) std::raise(SIGKILL);
        if (index == 8) throw 8;
        if (index == 9) _exit(3);
      };
    });
    for (const auto& [index, text] : all) {
      const std::string wanted = index % 5 == 1 ? "page " + std::to_string(index) + "..."
                                 : index == 7 || index == 19
                                     ? "the process that drew it ended with signal Killed"
                                 : index == 8 ? "stopped by an exception of unknown type"
                                 : index == 9 ? "the process that drew it ended with exit status 3"
                                              : "";
      EXPECT_EQ(text.substr(0, wanted.empty() ? 1 : wanted.size()), wanted) << index;
    }
  }
}

TEST(Workers, ThatCannotBeginEndTheRun) {
  const auto refusal = [](const std::function<Job()>& make) {
    try {
      ends(5, 2, make);
    } catch (const Refusal& refused) {
      return std::string(refused.what());
    }
    return std::string("not refused");
  };
  EXPECT_EQ(refusal([]() -> Job { throw Refusal("no such plug-in"); }), "no such plug-in");
  EXPECT_EQ(refusal([]() -> Job { _exit(4); }), "a process to draw in ended with exit status 4");
}

// A worker dies some time after its job, while nobody listens or while there is nothing more to do for it.
TEST(Workers, ThatDieBetweenTheirJobsCostNoJob) {
  const auto dieSoon = [] {
    if (fork() > 0) return;
    usleep(100'000);
    kill(getppid(), SIGKILL);
    _exit(0);
  };
  struct Case {
    std::size_t jobs, workers;
    useconds_t firstJob, notListening, lastJob;
  };
  for (const Case& one : {Case{3, 1, 0, 300'000, 0}, Case{2, 2, 200'000, 0, 700'000}}) {
    std::size_t done = 0;
    const Job job = [&](std::size_t index) {
      if (index == 0) {
        usleep(one.firstJob);
        dieSoon();
      }
      if (index == one.jobs - 1) usleep(one.lastJob);
    };
    doInWorkers(
        one.jobs, one.workers, [&job] { return job; },
        [&](const JobEnd& end) {
          EXPECT_FALSE(end.refusal) << end.index << *end.refusal;
          ++done;
          if (end.index == 0) usleep(one.notListening);
        });
    EXPECT_EQ(done, one.jobs);
  }
}

// They must not draw on when nobody collects what they draw.
TEST(Workers, EndWithTheProcessThatAsks) {
  int pipe[2];
  ASSERT_EQ(::pipe(pipe), 0);
  const pid_t asking = fork();
  if (asking == 0) {
    close(pipe[0]);
    doInWorkers(
        1000, 3, [] { return [](std::size_t) { usleep(1000); }; },
        [](const JobEnd& end) {
          if (end.index == 20) std::raise(SIGKILL);
        });
    _exit(0);
  }
  close(pipe[1]);
  char none = 0;
  // The end of the pipe comes when the last of them has closed it.
  EXPECT_EQ(::read(pipe[0], &none, 1), 0);
  close(pipe[0]);
}

}  // namespace
}  // namespace QeltDesktop
