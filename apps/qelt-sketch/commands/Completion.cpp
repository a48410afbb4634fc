#include "commands/Completion.h"

#include <algorithm>
#include <string_view>
#include <vector>

#include <CLI/CLI.hpp>

#include "commands/ShownOptions.h"

namespace QeltDesktop {
namespace {

std::string joined(const std::vector<std::string>& words, std::string_view between) {
  std::string text;
  for (const std::string& word : words) text += (text.empty() ? "" : std::string(between)) + word;
  return text;
}

// The name of the shell function.
std::string functionName(const CLI::App& app) {
  std::string name = "_" + app.get_name();
  std::replace(name.begin(), name.end(), '-', '_');
  return name;
}

std::vector<std::string> commandNames(const CLI::App& app) {
  std::vector<std::string> names;
  for (const CLI::App* const command : shownCommands(app)) names.push_back(command->get_name());
  return names;
}

// The branches of a case statement over "command:option before" that complete the values of options.
std::string bashValues(const CLI::App& app, const std::string& command) {
  std::string branches;
  for (const ShownOption& option : shownOptions(app)) {
    if (option.positional || !option.takesValue) continue;
    std::vector<std::string> patterns;
    for (const std::string& name : option.names) patterns.emplace_back(command).append(":").append(name);
    std::string action = "return";
    if (option.takesFile) action = "files=yes";
    if (!option.words.empty()) action = "words='" + joined(option.words, " ") + "'";
    branches += "    " + joined(patterns, " | ") + ") " + action + " ;;\n";
  }
  return branches;
}

std::string bashOptions(const CLI::App& app, const std::string& command) {
  std::vector<std::string> names;
  bool takesFiles = false;
  for (const ShownOption& option : shownOptions(app)) {
    if (!option.positional) names.insert(names.end(), option.names.begin(), option.names.end());
    takesFiles = takesFiles || (option.positional && option.takesFile);
  }
  return "      " + (command.empty() ? "''" : command) + ") options='" + joined(names, " ") + "'" +
         (takesFiles ? " files=yes" : "") + " ;;\n";
}

// As a part of what _arguments takes, in single quotes.
std::string zshQuoted(std::string_view text) {
  std::string quoted;
  for (const char c : text) {
    if (c == '\'') {
      quoted += "'\\''";
    } else if (c == '[' || c == ']' || c == ':' || c == '\\') {
      quoted += std::string("\\") + c;
    } else {
      quoted += c;
    }
  }
  return quoted;
}

std::string zshValue(const ShownOption& option) {
  std::string value = ':' + zshQuoted(option.positional ? option.names.front() : option.shape) + ':';
  if (!option.words.empty()) return value + '(' + joined(option.words, " ") + ')';
  return value + (option.takesFile ? "_files" : " ");
}

std::string zshOption(const ShownOption& option) {
  if (option.positional) return "'" + zshValue(option) + "'";
  std::vector<std::string> others = option.names;
  others.insert(others.end(), option.excluded.begin(), option.excluded.end());
  std::vector<std::string> names;
  for (const std::string& name : option.names)
    names.push_back(option.takesValue ? name + (name.starts_with("--") ? "=" : "+") : name);
  const std::string shown = names.size() == 1 ? "'" + names.front() : "'{" + joined(names, ",") + "}'";
  return "'(" + joined(others, " ") + ")" + (names.size() == 1 ? names.front() : shown) + '[' +
         zshQuoted(option.help) + ']' + (option.takesValue ? zshValue(option) : "") + "'";
}

std::string zshOptions(const CLI::App& app, const std::string& indent) {
  std::string specifications;
  for (const ShownOption& option : shownOptions(app)) specifications += " \\\n" + indent + zshOption(option);
  return specifications;
}

}  // namespace

std::string bashCompletion(const CLI::App& app) {
  const std::string& program = app.get_name();
  const std::string function = functionName(app);
  const std::vector<std::string> commands = commandNames(app);
  std::string values = bashValues(app, ""), options = bashOptions(app, "");
  for (const CLI::App* const command : shownCommands(app)) {
    values += bashValues(*command, command->get_name());
    options += bashOptions(*command, command->get_name());
  }
  return "# Completes the command line of " + program + " in bash; made by " + program +
         " --completion bash.\n" + function + R"(() {
  local current=${COMP_WORDS[COMP_CWORD]} before=${COMP_WORDS[COMP_CWORD - 1]}
  local command='' options='' words='' files='' i
  # The shell takes "--mode=live" for three words.
  if [[ $current == = ]]; then
    current=''
  elif [[ $before == = ]]; then
    before=${COMP_WORDS[COMP_CWORD - 2]}
  fi
  for ((i = 1; i < COMP_CWORD; ++i)); do
    case ${COMP_WORDS[i]} in
      )" +
         joined(commands, " | ") +
         R"() command=${COMP_WORDS[i]} && break ;;
    esac
  done
  COMPREPLY=()
  case $command:$before in
)" + values +
         R"(    *) case $command in
)" + options +
         R"(    esac ;;
  esac
  if [[ -n $options && $current == -* ]]; then
    words=$options files=''
  elif [[ -n $options && -z $command ]]; then
    words=')" +
         joined(commands, " ") + R"('
  fi
  if [[ -n $words ]]; then
    mapfile -t COMPREPLY < <(compgen -W "$words" -- "$current")
  elif [[ -n $files ]]; then
    compopt -o filenames 2>/dev/null
    mapfile -t COMPREPLY < <(compgen -f -- "$current")
  fi
}
complete -F )" +
         function + ' ' + program + '\n';
}

std::string zshCompletion(const CLI::App& app) {
  const std::string& program = app.get_name();
  const std::string function = functionName(app);
  std::string commands, branches;
  for (const CLI::App* const command : shownCommands(app)) {
    const std::string name = command->get_name();
    commands += "    '" + name + ':' + zshQuoted(command->get_description()) + "'\n";
    branches += "        " + name + ") _arguments" + zshOptions(*command, "          ") + " ;;\n";
  }
  return "#compdef " + program + "\n# Completes the command line of " + program + " in zsh; made by " +
         program + " --completion zsh.\n" + function + R"(() {
  local context state state_descr line
  typeset -A opt_args
  local -a commands
  commands=(
)" + commands +
         R"(  )
  _arguments -C)" +
         zshOptions(app, "    ") + R"( \
    '1:command:->command' '*::argument:->argument'
  case $state in
    command) _describe command commands ;;
    argument)
      case $words[1] in
)" + branches +
         R"(      esac ;;
  esac
}
)" + function +
         " \"$@\"\n";
}

}  // namespace QeltDesktop
