#include "commands/Archive.h"

#include <algorithm>
#include <cstdio>
#include <map>
#include <system_error>
#include <utility>

#include "ink/SourceText.h"

namespace QeltDesktop {
namespace {

namespace fs = std::filesystem;

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
    std::vector<fs::path> found;
    std::error_code error;
    fs::recursive_directory_iterator at(folder, error);
    for (; !error && at != fs::recursive_directory_iterator(); at.increment(error)) {
      if (at->path().extension() == ".inkml" && !at->is_directory(error)) found.push_back(at->path());
    }
    if (error) return mRefuse(folder.string() + ": cannot be read: " + error.message());
    if (found.empty()) return mRefuse(folder.string() + ": no ink (*.inkml) in this folder");
    std::ranges::sort(found);
    for (const fs::path& path : found) add(path, path.lexically_relative(folder));
  }

  void add(const fs::path& input, const fs::path& name) {
    fs::path output = (mFolder / name).replace_extension(".png");
    const auto [at, isNew] = mInputs.emplace(output, input);
    if (isNew) {
      mPages.push_back({input.string(), std::move(output)});
    } else if (at->second != input) {
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
    const SourceText list = SourceText::fromFile("/dev/stdin");
    for (std::size_t start = 0; start < list.text().size();) {
      const std::size_t end = std::min(list.text().find('\n', start), list.text().size());
      if (end > start) pages.add(list.text().substr(start, end - start));
      start = end + 1;
    }
  }
  return pages.take();
}

bool isUpToDate(const ArchivePage& page, const std::vector<fs::path>& program) {
  std::error_code error;
  const fs::file_time_type drawn = fs::last_write_time(page.output, error);
  if (error) return false;
  const auto isOlder = [&](const fs::path& path) {
    const fs::file_time_type written = fs::last_write_time(path, error);
    return !error && written < drawn;
  };
  return isOlder(page.input) && std::ranges::all_of(program, isOlder);
}

}  // namespace QeltDesktop
