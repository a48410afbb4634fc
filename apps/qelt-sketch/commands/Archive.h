#pragma once

#include <cstddef>
#include <filesystem>
#include <functional>
#include <string>
#include <vector>

namespace QeltDesktop {

// A page of an archive and the picture to draw of it.
struct ArchivePage {
  std::string input;
  std::filesystem::path output;
};

// The pages that paths name, each with its picture in `folder`: a file by its name; of a folder every *.inkml
// file in it, however deep, by its path from there, in the order of names; "-" stands for the paths that
// standard input lists, one a line. What cannot be taken is told to `refuse`, in a line that says why: a
// folder without ink, and a page whose picture is that of another page before it. Throws Refusal where the
// list cannot be read.
std::vector<ArchivePage> pagesOf(const std::vector<std::string>& paths, const std::filesystem::path& folder,
                                 const std::function<void(const std::string&)>& refuse);

// Whether the picture is there and was written after its page and every one of the files that it was drawn
// by.
bool isUpToDate(const ArchivePage& page, const std::vector<std::filesystem::path>& program);

}  // namespace QeltDesktop
