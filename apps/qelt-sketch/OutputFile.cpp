#include "OutputFile.h"

#include <unistd.h>

#include <array>
#include <cerrno>
#include <csignal>
#include <cstddef>
#include <cstring>
#include <filesystem>
#include <system_error>
#include <utility>

#include "Refusal.h"

namespace QeltDesktop {
namespace {

// The unfinished file, for the signal handler: a handler may only touch what is ready for it.
std::array<char, 4096> gUnfinished{};
volatile std::sig_atomic_t gHasUnfinished = 0;

extern "C" void removeUnfinished(int signal) {
  if (gHasUnfinished) unlink(gUnfinished.data());
  // The handler was reset as it was called: this ends the process as the signal would have.
  raise(signal);
}

void rememberUnfinished(const std::string& path) {
  if (path.size() >= gUnfinished.size()) return;
  std::memcpy(gUnfinished.data(), path.c_str(), path.size() + 1);
  gHasUnfinished = 1;
  struct sigaction action {};
  action.sa_handler = removeUnfinished;
  action.sa_flags = static_cast<int>(SA_RESETHAND);
  for (const int signal : {SIGINT, SIGTERM, SIGHUP}) sigaction(signal, &action, nullptr);
}

}  // namespace

OutputFile::OutputFile(const std::string& path, const std::string& input) : mShownPath(path), mPath(path) {
  if (path == "-") {
    mFile = stdout;
    return;
  }
  namespace fs = std::filesystem;
  std::error_code error;
  const fs::file_status status = fs::status(path, error);
  if (fs::is_directory(status)) {
    errno = EISDIR;
    refuse();
  }
  if (fs::is_regular_file(status) && !input.empty() && fs::equivalent(path, input, error))
    throw Refusal(path + ": cannot be written: it is the page to read");
  if (fs::exists(status) && !fs::is_regular_file(status)) {
    mFile = std::fopen(path.c_str(), "wb");
  } else {
    // A symbolic link stays one: its target is replaced.
    const fs::path target = fs::canonical(path, error);
    if (!error) mPath = target.string();
    mTemporaryPath = mPath + ".part" + std::to_string(getpid());
    mFile = std::fopen(mTemporaryPath.c_str(), "wb");
    if (mFile != nullptr) rememberUnfinished(mTemporaryPath);
  }
  if (mFile == nullptr) refuse();
}

OutputFile::~OutputFile() {
  if (mFile == nullptr || mFile == stdout) return;
  std::fclose(mFile);
  removeTemporary();
}

void OutputFile::write(std::string_view bytes) {
  if (std::fwrite(bytes.data(), 1, bytes.size(), mFile) != bytes.size()) refuse();
}

void OutputFile::commit() {
  if (mFile == stdout) {
    if (std::fflush(mFile) != 0) refuse();
    return;
  }
  // Some file systems tell only here that they are full.
  if (std::fclose(std::exchange(mFile, nullptr)) != 0) abandon();
  if (mTemporaryPath.empty()) return;
  if (std::rename(mTemporaryPath.c_str(), mPath.c_str()) != 0) abandon();
  gHasUnfinished = 0;
}

void OutputFile::removeTemporary() {
  if (mTemporaryPath.empty()) return;
  std::remove(mTemporaryPath.c_str());
  gHasUnfinished = 0;
}

void OutputFile::abandon() {
  const int error = errno;
  removeTemporary();
  errno = error;
  refuse();
}

void OutputFile::refuse() const {
  throw Refusal(mShownPath + ": cannot be written: " + std::strerror(errno));
}

}  // namespace QeltDesktop
