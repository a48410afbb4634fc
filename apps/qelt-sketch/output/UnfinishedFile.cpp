#include "output/UnfinishedFile.h"

#include <dirent.h>
#include <fcntl.h>
#include <sys/file.h>
#include <sys/stat.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <csignal>
#include <cstdint>
#include <cstdio>
#include <cstring>
#include <memory>
#include <random>

namespace QeltDesktop {
namespace {

constexpr std::string_view kPrefix = ".qelt-", kSuffix = ".part";

// For the signal handler, which may neither allocate nor call much else.
std::array<char, 64> gName{};
volatile std::sig_atomic_t gFolder = -1;

extern "C" void removeUnfinished(int signal) {
  const int error = errno;
  if (gFolder >= 0) unlinkat(gFolder, gName.data(), 0);
  errno = error;
  // The handler was reset when it was called, so this ends the process as the signal would have.
  raise(signal);
}

// FNV-1a. Two names with the same hash remove each other's abandoned files, which does no harm.
std::uint64_t hashOf(std::string_view name) {
  std::uint64_t hash = 0xcbf29ce484222325u;
  for (const char c : name) hash = (hash ^ static_cast<unsigned char>(c)) * 0x100000001b3u;
  return hash;
}

std::string prefixFor(std::string_view name) {
  std::array<char, 32> text{};
  std::snprintf(text.data(), text.size(), "%s%016llx-", kPrefix.data(),
                static_cast<unsigned long long>(hashOf(name)));
  return text.data();
}

void removeBeginningWith(std::string_view prefix, int folder) {
  FileDescriptor readable(openat(folder, ".", O_RDONLY | O_DIRECTORY | O_CLOEXEC));
  if (!readable) return;
  const std::unique_ptr<DIR, int (*)(DIR*)> entries(fdopendir(readable.number()), &closedir);
  if (!entries) return;
  readable.release();
  while (const dirent* const entry = readdir(entries.get())) {
    const std::string_view found = entry->d_name;
    if (!found.starts_with(prefix) || !found.ends_with(kSuffix)) continue;
    const FileDescriptor file(
        openat(folder, entry->d_name, O_RDWR | O_NONBLOCK | O_NOFOLLOW | O_NOCTTY | O_CLOEXEC));
    if (file && flock(file.number(), LOCK_EX | LOCK_NB) == 0) unlinkat(folder, entry->d_name, 0);
  }
}

}  // namespace

FileDescriptor makeUnfinished(int folder, std::string_view name, unsigned int permissions,
                              std::string& temporaryName) {
  constexpr int kTries = 100;
  std::random_device chance;
  for (int i = 0; i < kTries; ++i) {
    std::array<char, 16> end{};
    std::snprintf(end.data(), end.size(), "%08x", chance());
    temporaryName = prefixFor(name) + end.data() + std::string(kSuffix);
    FileDescriptor file(openat(folder, temporaryName.c_str(),
                               O_WRONLY | O_CREAT | O_EXCL | O_NOFOLLOW | O_CLOEXEC, permissions));
    if (!file) {
      if (errno == EEXIST) continue;
      return {};
    }
    // Before it was locked, another run may have taken it for abandoned and removed it.
    struct stat made {};
    const bool locked = flock(file.number(), LOCK_EX | LOCK_NB) == 0 || errno != EWOULDBLOCK;
    if (locked && fstat(file.number(), &made) == 0 && made.st_nlink > 0) return file;
  }
  errno = EEXIST;
  return {};
}

void removeAbandoned(int folder, std::string_view name) {
  removeBeginningWith(prefixFor(name), folder);
}

void removeAbandoned(const std::string& folder) {
  const FileDescriptor opened(open(folder.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
  if (opened) removeBeginningWith(kPrefix, opened.number());
}

void guardUnfinished(int folder, const std::string& temporaryName) {
  if (temporaryName.size() >= gName.size()) return;
  std::memcpy(gName.data(), temporaryName.c_str(), temporaryName.size() + 1);
  gFolder = folder;
  for (const int signal :
       {SIGHUP, SIGINT, SIGQUIT, SIGTERM, SIGPIPE, SIGXCPU, SIGABRT, SIGBUS, SIGFPE, SIGILL, SIGSEGV}) {
    struct sigaction present {};
    if (sigaction(signal, nullptr, &present) != 0 || present.sa_handler != SIG_DFL) continue;
    struct sigaction action {};
    action.sa_handler = removeUnfinished;
    action.sa_flags = static_cast<int>(SA_RESETHAND);
    sigaction(signal, &action, nullptr);
  }
}

void forgetUnfinished() {
  gFolder = -1;
}

}  // namespace QeltDesktop
