#include "commands/Workers.h"

#include <poll.h>
#include <sys/socket.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstdio>
#include <cstring>
#include <exception>
#include <memory>
#include <new>
#include <string_view>
#include <utility>
#include <vector>

#include "output/OutputPlace.h"
#include "text/Refusal.h"

namespace QeltDesktop {
namespace {

// What a worker answers: one letter, and why the job was not done.
enum class Answer : char { Ready = 'r', CannotWork = 'c', Done = 'd', Refused = 'n' };
constexpr std::size_t kLongestAnswer = 16384;

void answer(int connection, Answer kind, std::string_view why = {}) {
  const std::string message = static_cast<char>(kind) + std::string(why.substr(0, kLongestAnswer - 1));
  if (send(connection, message.data(), message.size(), MSG_NOSIGNAL) < 0) _exit(1);  // nobody asks any more
}

// Does what it is asked for until nobody asks.
[[noreturn]] void work(int connection, const std::function<Job()>& makeJob) {
  try {
    const Job job = makeJob();
    answer(connection, Answer::Ready);
    std::size_t index = 0;
    while (recv(connection, &index, sizeof index, 0) == static_cast<ssize_t>(sizeof index)) {
      try {
        job(index);
        answer(connection, Answer::Done);
      } catch (const std::bad_alloc&) {
        answer(connection, Answer::Refused, "out of memory");
      } catch (const std::exception& error) {
        answer(connection, Answer::Refused, error.what());
      } catch (...) {
        answer(connection, Answer::Refused, "stopped by an exception of unknown type");  // of a plug-in
      }
    }
  } catch (const std::exception& error) {
    answer(connection, Answer::CannotWork, error.what());
  }
  // What the process shares with its parent, such as unwritten output, is the parent's to finish.
  _exit(0);
}

class Worker {
 public:
  Worker(const std::function<Job()>& makeJob, std::vector<std::unique_ptr<Worker>>& others) {
    int ends[2];
    if (socketpair(AF_UNIX, SOCK_SEQPACKET | SOCK_CLOEXEC, 0, ends) != 0) refuse();
    mConnection = FileDescriptor(ends[0]);
    FileDescriptor theirs(ends[1]);
    mProcess = fork();
    if (mProcess < 0) refuse();
    if (mProcess > 0) return;
    // Each connection ends with the process that asks: no other worker may hold it open.
    mConnection = FileDescriptor();
    for (const auto& other : others) other->mConnection = FileDescriptor();
    work(theirs.number(), makeJob);
  }
  ~Worker() { end(); }
  Worker(const Worker&) = delete;
  Worker& operator=(const Worker&) = delete;

  int connection() const { return mConnection.number(); }
  bool ask(std::size_t index) {
    job = index;
    return send(connection(), &index, sizeof index, MSG_NOSIGNAL) == static_cast<ssize_t>(sizeof index);
  }
  // Nothing when the worker is gone.
  std::optional<std::pair<Answer, std::string>> hear() {
    std::string message(kLongestAnswer, '\0');
    const ssize_t size = recv(connection(), message.data(), message.size(), 0);
    if (size <= 0) return std::nullopt;
    message.resize(static_cast<std::size_t>(size));
    return std::pair(static_cast<Answer>(message[0]), message.substr(1));
  }
  // Lets the worker finish, and answers how it ended.
  std::string end() {
    mConnection = FileDescriptor();
    int status = 0;
    const pid_t process = std::exchange(mProcess, -1);
    if (process <= 0) return {};
    while (waitpid(process, &status, 0) < 0 && errno == EINTR) {
    }
    return WIFSIGNALED(status) ? std::string("signal ") + strsignal(WTERMSIG(status))
                               : "exit status " + std::to_string(WEXITSTATUS(status));
  }

  std::optional<std::size_t> job;  // the one it does

 private:
  [[noreturn]] static void refuse() {
    throw Refusal(std::string("no process can be started to draw in: ") + std::strerror(errno));
  }

  FileDescriptor mConnection;
  pid_t mProcess = -1;
};

// The workers of a run.
class Crew {
 public:
  Crew(std::size_t workers, const std::function<Job()>& makeJob) : mWanted(workers), mMakeJob(makeJob) {}

  // Starts what is missing of as many as are wanted, and at most `useful`. Where no more can be started,
  // those that there are have to do; where there are none, it throws Refusal.
  void fill(std::size_t useful) {
    while (mWorkers.size() < std::min(mWanted, useful)) {
      try {
        mWorkers.push_back(std::make_unique<Worker>(mMakeJob, mWorkers));
      } catch (const Refusal&) {
        if (mWorkers.empty()) throw;
        mWanted = mWorkers.size();
      }
    }
  }

  // One of them could not begin, or ended while it had nothing to do.
  void doWithout(const Worker* worker, const std::string& why) {
    remove(worker);
    if (mWorkers.empty() && --mStarts == 0) throw Refusal(why);
    mWanted = std::max<std::size_t>(mWorkers.size(), 1);
  }
  void remove(const Worker* worker) {
    std::erase_if(mWorkers, [worker](const auto& one) { return one.get() == worker; });
  }

  const std::vector<std::unique_ptr<Worker>>& workers() const { return mWorkers; }

 private:
  std::size_t mWanted;
  int mStarts = 3;  // how often a last worker may fail without a job
  const std::function<Job()>& mMakeJob;
  std::vector<std::unique_ptr<Worker>> mWorkers;
};

}  // namespace

void doInWorkers(std::size_t jobs, std::size_t workers, const std::function<Job()>& makeJob,
                 const std::function<void(const JobEnd&)>& ended) {
  // A worker would print what is waiting here once more.
  std::fflush(nullptr);
  Crew crew(workers, makeJob);
  std::size_t next = 0, open = jobs;
  const auto finish = [&](const JobEnd& end) {
    --open;
    ended(end);
  };
  while (open > 0) {
    crew.fill(open);
    std::vector<pollfd> polled;
    std::vector<Worker*> present;
    for (const auto& worker : crew.workers()) {
      polled.push_back({worker->connection(), POLLIN, 0});
      present.push_back(worker.get());
    }
    if (poll(polled.data(), polled.size(), -1) < 0) {
      if (errno == EINTR) continue;
      throw Refusal(std::string("workers cannot be waited for: ") + std::strerror(errno));
    }
    for (std::size_t i = 0; i < present.size(); ++i) {
      if (polled[i].revents == 0) continue;
      Worker& worker = *present[i];
      const auto heard = worker.hear();
      const std::optional<std::size_t> job = std::exchange(worker.job, std::nullopt);
      if (!heard) {
        const std::string how = worker.end();
        if (job) {
          crew.remove(&worker);
          finish({*job, "the process that drew it ended with " + how});
        } else {
          crew.doWithout(&worker, "a process to draw in ended with " + how);
        }
        continue;
      }
      if (heard->first == Answer::CannotWork) {
        if (crew.workers().size() == 1) throw Refusal(heard->second);
        crew.doWithout(&worker, heard->second);
        continue;
      }
      if (job) finish({*job, heard->first == Answer::Done ? std::nullopt : std::optional(heard->second)});
      if (next == jobs) continue;
      if (worker.ask(next)) {
        ++next;
      } else {
        worker.job.reset();  // it is gone, as the next look at it tells
      }
    }
  }
}

}  // namespace QeltDesktop
