#pragma once

#include <string>
#include <vector>

namespace CLI {
class App;
}  // namespace CLI

namespace QeltDesktop {

// An option or a positional argument as the manual page and the completion show it.
struct ShownOption {
  std::vector<std::string> names;  // "-o", "--output"; of a positional argument its name
  std::string shape;               // of its value ("WxH"); empty if it has none
  std::string help;
  std::vector<std::string> words;     // the values that are words, if any
  std::vector<std::string> excluded;  // names of options that it does not go with
  bool positional = false;
  bool required = false;
  bool takesValue = false;
  bool takesFile = false;  // the value is a path, as that of every positional argument is
};

// The options of the program or of a command, in the order of the help; hidden ones are left out.
std::vector<ShownOption> shownOptions(const CLI::App& app);

// The commands of the program, in the order of the help.
std::vector<const CLI::App*> shownCommands(const CLI::App& app);

}  // namespace QeltDesktop
