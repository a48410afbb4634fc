#pragma once

#include <chrono>
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
// folder without ink or one that cannot be read, and a page whose picture is that of another page before it.
// Throws Refusal where the list cannot be read.
std::vector<ArchivePage> pagesOf(const std::vector<std::string>& paths, const std::filesystem::path& folder,
                                 const std::function<void(const std::string&)>& refuse);

// A moment by the clock that file systems take times from, which lags behind others by some milliseconds.
using FileTime = std::chrono::time_point<std::chrono::system_clock, std::chrono::nanoseconds>;
FileTime clockOfFiles();

// When the newest of what pages are drawn by came to be what it is: the program, its libraries and the
// plug-in.
FileTime programTime(const std::string& plugin);

// Whether the picture is there and has a later time than its page and the program.
bool isUpToDate(const ArchivePage& page, FileTime program);

}  // namespace QeltDesktop
