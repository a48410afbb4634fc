#pragma once

#include <string>

namespace CLI {
class App;
}  // namespace CLI

namespace QeltDesktop {

// The program's manual page, as roff for the man macros, from the options of all its commands. `version` is
// the program's name and version.
std::string manualPage(const CLI::App& app, const std::string& version);

// What each exit status means, one a line.
std::string exitStatuses();

}  // namespace QeltDesktop
