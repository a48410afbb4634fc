#pragma once

#include <string>

namespace CLI {
class App;
}  // namespace CLI

namespace QeltDesktop {

// Scripts by which a shell completes the command line of the program: commands, options, the words that
// options take, and files.
std::string bashCompletion(const CLI::App& app);
std::string zshCompletion(const CLI::App& app);

}  // namespace QeltDesktop
