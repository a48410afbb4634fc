#include "commands/Archive.h"

#include <link.h>
#include <sys/stat.h>

#include <algorithm>
#include <ctime>
#include <map>
#include <system_error>
#include <utility>

#include "ink/SourceText.h"

namespace QeltDesktop {
namespace {

namespace fs = std::filesystem;

FileTime timeOf(const timespec& time) {
  return FileTime(std::chrono::seconds(time.tv_sec) + std::chrono::nanoseconds(time.tv_nsec));
}

class PageList {
 public:
  PageList(const fs::path& folder, const std::function<void(const std::string&)>& refuse)
      : mFolder(folder), mRefuse(refuse) {}

  void add(const fs::path& path) {
    std::error_code error;
    if (fs::is_directory(path, error)) {
      addFolder(path);
    } else {
      add(path, path.filename());
    }
  }

  std::vector<ArchivePage> take() { return std::move(mPages); }

 private:
  void addFolder(const fs::path& folder) {
    const std::size_t before = mPages.size();
    const bool isRead = addFilesBelow(folder, folder);
    if (isRead && mPages.size() == before) mRefuse(folder.string() + ": no ink (*.inkml) in this folder");
  }

  // False where some of it could not be read.
  bool addFilesBelow(const fs::path& folder, const fs::path& top) {
    std::vector<fs::path> found;
    std::error_code error;
    fs::directory_iterator at(folder, error);
    for (; !error && at != fs::directory_iterator(); at.increment(error)) found.push_back(at->path());
    if (error) mRefuse(folder.string() + ": cannot be read: " + error.message());
    std::ranges::sort(found);
    bool isRead = !error;
    for (const fs::path& path : found) {
      // Links to folders are not followed: they may lead back. A link to nowhere is told when it is drawn.
      const fs::file_type type = fs::symlink_status(path, error).type();
      if (type == fs::file_type::directory) {
        isRead = addFilesBelow(path, top) && isRead;
      } else if (path.extension() == ".inkml" && isFile(path)) {
        add(path, path.lexically_relative(top));
      }
    }
    return isRead;
  }

  // Pipes and the like would be waited for.
  static bool isFile(const fs::path& path) {
    std::error_code error;
    const fs::file_type type = fs::status(path, error).type();
    return type == fs::file_type::regular || type == fs::file_type::not_found;
  }

  void add(const fs::path& input, const fs::path& name) {
    fs::path output = (mFolder / name).replace_extension(".png");
    const auto [at, isNew] = mInputs.emplace(output, input);
    if (isNew) {
      mPages.push_back({input.string(), std::move(output)});
    } else if (std::error_code error; at->second != input && !fs::equivalent(at->second, input, error)) {
      mRefuse(input.string() + ": its picture would be that of " + at->second.string() + ": " +
              output.string());
    }
  }

  const fs::path& mFolder;
  const std::function<void(const std::string&)>& mRefuse;
  std::vector<ArchivePage> mPages;
  std::map<fs::path, fs::path> mInputs;  // by output
};

}  // namespace

std::vector<ArchivePage> pagesOf(const std::vector<std::string>& paths, const fs::path& folder,
                                 const std::function<void(const std::string&)>& refuse) {
  PageList pages(folder, refuse);
  for (const std::string& path : paths) {
    if (path != "-") {
      pages.add(path);
      continue;
    }
    const SourceText list = SourceText::fromStandardInput();
    for (std::size_t start = 0; start < list.text().size();) {
      const std::size_t end = std::min(list.text().find('\n', start), list.text().size());
      std::string line = list.text().substr(start, end - start);
      if (line.ends_with('\r')) line.pop_back();
      if (line == "-") line = "./-";  // a file of that name, as standard input is the list
      if (!line.empty()) pages.add(line);
      start = end + 1;
    }
  }
  return pages.take();
}

FileTime clockOfFiles() {
  timespec now{};
  clock_gettime(CLOCK_REALTIME_COARSE, &now);
  return timeOf(now);
}

FileTime programTime(const std::string& plugin) {
  std::vector<std::string> files{"/proc/self/exe", plugin};
  dl_iterate_phdr(
      [](dl_phdr_info* object, std::size_t, void* list) {
        const fs::path path = object->dlpi_name;
        if (path.filename().string().starts_with("libQelt"))
          static_cast<std::vector<std::string>*>(list)->push_back(path.string());
        return 0;
      },
      &files);
  FileTime latest{};
  for (const std::string& file : files) {
    struct stat status {};
    // Packages keep the time at which a file was built; its status changed when it was installed.
    if (stat(file.c_str(), &status) == 0)
      latest = std::max({latest, timeOf(status.st_mtim), timeOf(status.st_ctim)});
  }
  return latest;
}

bool isUpToDate(const ArchivePage& page, FileTime program) {
  struct stat input {};
  struct stat picture {};
  if (stat(page.input.c_str(), &input) != 0 || stat(page.output.c_str(), &picture) != 0) return false;
  return std::max(timeOf(input.st_mtim), program) < timeOf(picture.st_mtim);
}

}  // namespace QeltDesktop
