#pragma once

#include <cstddef>
#include <functional>
#include <optional>
#include <string>

namespace QeltDesktop {

// Does one of the jobs, in a worker. What it throws ends the job, not the worker.
using Job = std::function<void(std::size_t index)>;

// How a job ended: done, or with the text of what it threw.
struct JobEnd {
  std::size_t index;
  std::optional<std::string> refusal;
};

// Does jobs 0 to `jobs` - 1 in `workers` processes beside each other, each job once. `makeJob` runs in every
// worker before its first job; what it throws is thrown here, and all ends. `ended` is called here as jobs
// end, in any order. A worker that crashes takes only its job with it. When the process that called this is
// killed, workers finish the jobs that they have and end. Call it before the process has threads.
void doInWorkers(std::size_t jobs, std::size_t workers, const std::function<Job()>& makeJob,
                 const std::function<void(const JobEnd&)>& ended);

}  // namespace QeltDesktop
