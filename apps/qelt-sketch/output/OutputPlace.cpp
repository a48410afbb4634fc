#include "output/OutputPlace.h"

#include <fcntl.h>
#include <linux/magic.h>
#include <sys/vfs.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <climits>
#include <cstring>
#include <filesystem>
#include <system_error>

#include "text/NumberText.h"
#include "text/Refusal.h"

namespace QeltDesktop {
namespace {

namespace fs = std::filesystem;

// The kernel follows as many.
constexpr int kMostLinks = 40;

Refusal unwritable(const std::string& path, const std::string& why) {
  return Refusal(path + ": cannot be written: " + why);
}

Refusal unwritable(const std::string& path, int error) {
  return unwritable(path, std::strerror(error));
}

// The kernel shows a process's descriptors as links in a folder "fd"; their targets are not always paths.
bool holdsDescriptors(const OutputPlace& place, const fs::path& folder) {
  struct statfs system {};
  if (fstatfs(place.folder.number(), &system) != 0 || system.f_type != PROC_SUPER_MAGIC) return false;
  std::error_code error;
  return fs::canonical(folder, error).filename() == "fd";
}

bool isOwnFolder(const fs::path& folder) {
  std::error_code error;
  for (const char* const own : {"/proc/self/fd", "/proc/thread-self/fd"}) {
    if (fs::equivalent(folder, own, error)) return true;
  }
  return false;
}

bool isPlanted(const OutputPlace& place) {
  struct stat folder {};
  if (fstat(place.folder.number(), &folder) != 0) return true;
  const bool openToAll = (folder.st_mode & S_ISVTX) != 0 && (folder.st_mode & S_IWOTH) != 0;
  const uid_t owner = place.present->st_uid;
  return openToAll && owner != geteuid() && owner != folder.st_uid;
}

std::string linkAt(const OutputPlace& place) {
  std::array<char, PATH_MAX> text{};
  const ssize_t length = readlinkat(place.folder.number(), place.name.c_str(), text.data(), text.size());
  return length < 0 ? std::string() : std::string(text.data(), static_cast<std::size_t>(length));
}

}  // namespace

OutputPlace outputPlaceOf(const std::string& path) {
  if (path.empty()) throw unwritable(path, ENOENT);
  fs::path at = path;
  for (int links = 0; links <= kMostLinks; ++links) {
    const fs::path folder = at.has_parent_path() ? at.parent_path() : fs::path(".");
    OutputPlace place;
    place.name = at.filename().string();
    place.folder = FileDescriptor(open(folder.c_str(), O_PATH | O_DIRECTORY | O_CLOEXEC));
    if (!place.folder) throw unwritable(path, errno);
    if (place.name.empty() || place.name == "." || place.name == "..") throw unwritable(path, EISDIR);
    struct stat present {};
    if (fstatat(place.folder.number(), place.name.c_str(), &present, AT_SYMLINK_NOFOLLOW) != 0) {
      if (errno != ENOENT) throw unwritable(path, errno);
      return place;
    }
    place.present = present;
    if (!S_ISLNK(present.st_mode)) return place;
    if (holdsDescriptors(place, folder)) {
      place.descriptor = parseInt(place.name);
      if (place.descriptor && isOwnFolder(folder)) return place;
      throw unwritable(path, "it is another program's open file");
    }
    if (isPlanted(place)) throw unwritable(path, "another user put a link there");
    const std::string target = linkAt(place);
    if (target.empty()) throw unwritable(path, errno);
    at = folder / target;  // an absolute target stands for itself
  }
  throw unwritable(path, ELOOP);
}

}  // namespace QeltDesktop
