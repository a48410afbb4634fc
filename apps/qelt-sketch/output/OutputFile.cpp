#include "output/OutputFile.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <csignal>
#include <cstring>
#include <optional>
#include <utility>

#include "output/OutputPlace.h"
#include "output/UnfinishedFile.h"
#include "text/Refusal.h"

namespace QeltDesktop {
namespace {

bool isSameFile(const struct stat& one, const std::string& path) {
  struct stat other {};
  return stat(path.c_str(), &other) == 0 && one.st_dev == other.st_dev && one.st_ino == other.st_ino;
}

// Gives the file the permissions of the file that it will replace, and its owner where the process may.
bool takeOver(int file, const struct stat& older) {
  constexpr mode_t kPermissions = 07777, kSetId = S_ISUID | S_ISGID;
  const bool sameOwner = fchown(file, older.st_uid, older.st_gid) == 0;
  return fchmod(file, older.st_mode & (sameOwner ? kPermissions : kPermissions & ~kSetId)) == 0;
}

// Signals wait until it is gone.
class SignalsHeld {
 public:
  SignalsHeld() {
    sigset_t all;
    sigfillset(&all);
    pthread_sigmask(SIG_BLOCK, &all, &mBefore);
  }
  ~SignalsHeld() { pthread_sigmask(SIG_SETMASK, &mBefore, nullptr); }
  SignalsHeld(const SignalsHeld&) = delete;
  SignalsHeld& operator=(const SignalsHeld&) = delete;

 private:
  sigset_t mBefore{};
};

}  // namespace

OutputFile::OutputFile(const std::string& path, const std::string& input, Abandoned abandoned)
    : mShownPath(path), mAbandoned(abandoned) {
  if (path == "-") {
    mFile = stdout;
    return;
  }
  OutputPlace place = outputPlaceOf(path);
  if (place.descriptor) {
    struct stat opened {};
    if (fstat(*place.descriptor, &opened) != 0) refuse();
    place.present = opened;
  }
  const bool isRegular = place.present && S_ISREG(place.present->st_mode);
  if (isRegular && !input.empty() && isSameFile(*place.present, input))
    throw Refusal(path + ": cannot be written: it is the page to read");
  if (place.descriptor || (place.present && !isRegular)) {
    openDirectly(place);
  } else {
    openBeside(std::move(place));
  }
}

OutputFile::~OutputFile() {
  if (mFile != nullptr && mFile != stdout) std::fclose(mFile);
  removeTemporary();
}

void OutputFile::openDirectly(const OutputPlace& place) {
  if (!place.descriptor && S_ISDIR(place.present->st_mode)) {
    errno = EISDIR;
    refuse();
  }
  // A descriptor is duplicated, not opened anew, which would overwrite what was written through it before.
  FileDescriptor file(place.descriptor ? fcntl(*place.descriptor, F_DUPFD_CLOEXEC, 0)
                                       : openat(place.folder.number(), place.name.c_str(),
                                                O_WRONLY | O_NOCTTY | O_NOFOLLOW | O_CLOEXEC));
  if (!file || (mFile = fdopen(file.number(), "wb")) == nullptr) refuse();
  file.release();
}

void OutputFile::openBeside(OutputPlace place) {
  constexpr unsigned int kAnybody = 0666, kOwner = 0600, kWritable = 0222;
  mFolder = std::move(place.folder);
  mName = std::move(place.name);
  if (place.present) {
    const struct stat& older = *place.present;
    // The administrator may write every file; one that is marked as read-only is refused all the same.
    if ((older.st_mode & kWritable) == 0) {
      errno = EACCES;
      refuse();
    }
    if (faccessat(mFolder.number(), mName.c_str(), W_OK, AT_EACCESS) != 0) refuse();
    if (older.st_nlink > 1)
      throw Refusal(mShownPath + ": cannot be written: it has another name too (a hard link), " +
                    "which would keep the older content");
  }
  if (mAbandoned == Abandoned::Remove) removeAbandoned(mFolder.number(), mName);
  FileDescriptor file;
  {
    const SignalsHeld held;  // none comes between the file and who removes it
    file = makeUnfinished(mFolder.number(), mName, place.present ? kOwner : kAnybody, mTemporaryName);
    if (file) guardUnfinished(mFolder.number(), mTemporaryName);
  }
  if (!file) {
    mTemporaryName.clear();
    refuse();
  }
  const bool ready = (!place.present || takeOver(file.number(), *place.present)) &&
                     (mFile = fdopen(file.number(), "wb")) != nullptr;
  if (!ready) {
    const int error = errno;
    removeTemporary();
    errno = error;
    refuse();
  }
  file.release();
}

void OutputFile::write(std::string_view bytes) {
  if (std::fwrite(bytes.data(), 1, bytes.size(), mFile) != bytes.size()) refuse();
}

void OutputFile::setTime(std::chrono::time_point<std::chrono::system_clock, std::chrono::nanoseconds> time) {
  const auto seconds = std::chrono::floor<std::chrono::seconds>(time);
  mTime = timespec{static_cast<time_t>(seconds.time_since_epoch().count()), (time - seconds).count()};
}

void OutputFile::commit() {
  flush();
  if (mFile == stdout) return;
  if (!mTemporaryName.empty()) {
    if (mTime) {
      const timespec times[] = {*mTime, *mTime};
      futimens(fileno(mFile), times);
    }
    const int folder = mFolder.number();
    if (renameat(folder, mTemporaryName.c_str(), folder, mName.c_str()) != 0) refuse();
    mTemporaryName.clear();
    forgetUnfinished();
  }
  if (std::fclose(std::exchange(mFile, nullptr)) != 0) refuse();
}

// The bytes reach the disk before the file is renamed, so that a crash of the machine leaves either the older
// file or this one, complete.
void OutputFile::flush() {
  if (std::fflush(mFile) != 0) refuse();
  // Some file systems cannot synchronise; others report only here that they are full.
  if (!mTemporaryName.empty() && fsync(fileno(mFile)) != 0 && errno != EINVAL && errno != EROFS) refuse();
}

void OutputFile::removeTemporary() {
  if (mTemporaryName.empty()) return;
  unlinkat(mFolder.number(), mTemporaryName.c_str(), 0);
  mTemporaryName.clear();
  forgetUnfinished();
}

void OutputFile::refuse() const {
  throw Refusal(mShownPath + ": cannot be written: " + std::strerror(errno));
}

}  // namespace QeltDesktop
