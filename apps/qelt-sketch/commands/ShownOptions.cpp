#include "commands/ShownOptions.h"

#include <algorithm>
#include <sstream>
#include <string_view>

#include <CLI/CLI.hpp>

namespace QeltDesktop {
namespace {

constexpr std::string_view kFile = "FILE", kFileOrFolder = "PATH";

std::vector<std::string> namesOf(const CLI::Option& option) {
  std::vector<std::string> names;
  for (const std::string& name : option.get_snames()) names.push_back("-" + name);
  for (const std::string& name : option.get_lnames()) names.push_back("--" + name);
  if (names.empty()) names.push_back(option.get_name());
  return names;
}

// Of a shape such as "white|transparent|'#RRGGBB'" those alternatives that are written as they stand.
std::vector<std::string> wordsIn(const std::string& shape) {
  std::vector<std::string> words;
  if (shape.find('|') == std::string::npos) return words;
  std::istringstream alternatives(shape);
  for (std::string word; std::getline(alternatives, word, '|');) {
    const bool isPlain = std::all_of(word.begin(), word.end(), [](char c) { return c >= 'a' && c <= 'z'; });
    if (isPlain) words.push_back(word);
  }
  return words;
}

}  // namespace

std::vector<ShownOption> shownOptions(const CLI::App& app) {
  std::vector<ShownOption> shown;
  for (const CLI::Option* const option : app.get_options()) {
    if (option->get_group().empty()) continue;
    ShownOption& added = shown.emplace_back();
    added.names = namesOf(*option);
    added.help = option->get_description();
    added.positional = option->get_positional();
    added.required = option->get_required();
    added.takesValue = option->get_items_expected_max() > 0;
    if (added.takesValue) added.shape = option->get_type_name();
    added.words = wordsIn(added.shape);
    added.takesFile = added.positional || added.shape == kFile || added.shape == kFileOrFolder;
    for (const CLI::Option* const other : option->get_excludes()) {
      const std::vector<std::string> names = namesOf(*other);
      added.excluded.insert(added.excluded.end(), names.begin(), names.end());
    }
  }
  return shown;
}

std::vector<const CLI::App*> shownCommands(const CLI::App& app) {
  return app.get_subcommands([](const CLI::App* command) { return !command->get_group().empty(); });
}

}  // namespace QeltDesktop
