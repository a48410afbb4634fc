#include "commands/Manual.h"

#include <cctype>
#include <string_view>
#include <vector>

#include <CLI/CLI.hpp>

#include "commands/ShownOptions.h"

namespace QeltDesktop {
namespace {

struct Entry {
  std::string_view term, meaning;
};

constexpr Entry kStatuses[] = {
    {"0", "done"},
    {"1",
     "could not be done; one line on standard error says what and where. Of compare also: pictures differ"},
    {"2", "wrong usage; standard error says what is wrong, and nothing was done"},
};

// What stands in capitals stands for something.
constexpr Entry kMessages[] = {
    {"FILE:LINE: WHAT: VALUE",
     "What the page says in this line is malformed, or a unit that is not known. Nothing is drawn of such a "
     "page. In a picture that carries its page, the line is one of that page."},
    {"FILE: cannot be read: REASON", "There is no such file, or it may not be read."},
    {"FILE: cannot be written: REASON", "An older file there stays as it was."},
    {"FILE: WHAT",
     "A picture without ink or with damaged ink, or one that was drawn with options that are "
     "not understood."},
    {"FILE: the picture is too large to draw: SIZE, at most LIMITS; --fit WxH draws it smaller",
     "With --page or --fit, the message begins with the option that asks for too much."},
    {"FILE: the page is too large to draw at any zoom: its points lie too far apart",
     "They span more than single precision can count, 3.4e38 stroke units. With --page, a part is drawn."},
    {"OPTION: expects WHAT, not 'VALUE'", "Wrong usage, like everything about the command line."},
};

constexpr Entry kExamples[] = {
    {"qelt-sketch draw ink.inkml -o page.png --zoom 2", "A page of InkML as a picture, twice as large."},
    {"qelt-sketch draw ink.inkml -o page.png --fit 1024x768", "The same, as large as it fits."},
    {"qelt-sketch draw page.png -o again.png", "The same picture again, from the page that it carries."},
    {"qelt-sketch compare before/ after/ --tolerance 1", "Which pictures differ, after a new driver say."},
    {"zcat ink.inkml.gz | qelt-sketch trace - -o - | wc -l", "From standard input to standard output."},
};

constexpr std::string_view kDescription =
    "A page is an InkML file, or a picture that qelt-sketch draw made, which carries the page and the "
    "options "
    "that it was drawn with. Lengths are stroke units, 96 an inch. The output appears complete or not at "
    "all. Messages call standard input by that name.";

// Text as roff takes it literally.
std::string literal(std::string_view text) {
  std::string roff;
  for (const char c : text) {
    if (c == '\\') {
      roff += "\\e";
    } else if (c == '-') {
      roff += "\\-";
    } else if (c == '\'') {
      roff += "\\(aq";
    } else {
      roff += c;
    }
  }
  return roff;
}

// The same as a line of its own, which is no request.
std::string line(std::string_view text) {
  return (text.starts_with('.') ? "\\&" : "") + literal(text) + '\n';
}

std::string bold(std::string_view text) {
  return "\\fB" + literal(text) + "\\fR";
}
std::string italic(std::string_view text) {
  return "\\fI" + literal(text) + "\\fR";
}

std::string capitals(std::string text) {
  for (char& c : text) c = static_cast<char>(std::toupper(static_cast<unsigned char>(c)));
  return text;
}

std::string section(const std::string& title) {
  return ".SH " + title + '\n';
}

std::string sentence(const std::string& text) {
  std::string begun = text;
  if (!begun.empty())
    begun.front() = static_cast<char>(std::toupper(static_cast<unsigned char>(begun.front())));
  return begun.ends_with('.') ? begun : begun + '.';
}

std::string term(const ShownOption& option) {
  std::string text;
  for (const std::string& name : option.names) {
    text += (text.empty() ? "" : ", ") + (option.positional ? italic(name) : bold(name));
  }
  if (!option.shape.empty()) text += ' ' + italic(option.shape);
  return text;
}

std::string optionList(const CLI::App& app) {
  std::string roff;
  for (const ShownOption& option : shownOptions(app)) {
    roff += ".TP\n" + term(option) + '\n' + line(sentence(option.help));
    for (const std::string& other : option.excluded) roff += line("Not with " + other + ".");
  }
  return roff;
}

// "qelt-sketch draw [OPTIONS] -o FILE [INPUT]"
std::string synopsis(const std::string& program, const CLI::App& command) {
  std::string text = bold(program + ' ' + command.get_name());
  std::string positionals;
  bool hasOthers = false;
  std::string required;
  for (const ShownOption& option : shownOptions(command)) {
    if (option.positional) {
      const std::string name = italic(option.names.front());
      positionals += option.required ? ' ' + name : " [" + name + ']';
    } else if (option.required) {
      required += ' ' + bold(option.names.front()) + ' ' + italic(option.shape);
    } else {
      hasOthers = true;
    }
  }
  return text + (hasOthers ? " [" + italic("OPTIONS") + ']' : "") + positionals + required + '\n';
}

template <std::size_t count>
std::string list(const Entry (&entries)[count]) {
  std::string roff;
  for (const Entry& entry : entries)
    roff += ".TP\n" + bold(entry.term) + '\n' + line(sentence(std::string(entry.meaning)));
  return roff;
}

}  // namespace

std::string exitStatuses() {
  std::string text = "Exit status:\n";
  for (const Entry& status : kStatuses)
    text += "  " + std::string(status.term) + "  " + std::string(status.meaning) + '\n';
  return text;
}

std::string manualPage(const CLI::App& app, const std::string& version) {
  const std::string& program = app.get_name();
  std::string roff = ".\\\" Made by " + literal(program + " --man") + " from its options.\n";
  // No date, so that the same program makes the same page.
  roff += ".TH " + capitals(program) + " 1 \"\" \"" + version + "\" \"User Commands\"\n";
  // No hyphens but those of the text, and nothing spread out.
  roff += ".nh\n.ad l\n";
  std::string what = app.get_description();
  what.front() = static_cast<char>(std::tolower(static_cast<unsigned char>(what.front())));
  if (what.ends_with('.')) what.pop_back();
  roff += section("NAME") + literal(program) + " \\- " + literal(what) + '\n';
  roff += section("SYNOPSIS");
  for (const CLI::App* const command : shownCommands(app)) roff += synopsis(program, *command) + ".br\n";
  roff += bold(program) + ' ' + italic("OPTION") + '\n';
  roff += section("DESCRIPTION") + line(kDescription);
  roff += section("OPTIONS") + optionList(app);
  roff += section("COMMANDS");
  for (const CLI::App* const command : shownCommands(app)) {
    roff += ".SS " + literal(command->get_name()) + '\n' + line(sentence(command->get_description()));
    roff += optionList(*command);
    if (const std::string footer = command->get_footer(); !footer.empty()) roff += ".PP\n" + line(footer);
  }
  roff += section("EXIT STATUS") + list(kStatuses);
  roff += section("DIAGNOSTICS") + list(kMessages);
  roff += section("EXAMPLES") + list(kExamples);
  return roff;
}

}  // namespace QeltDesktop
