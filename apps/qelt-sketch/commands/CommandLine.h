#pragma once

#include <exception>
#include <string>
#include <utility>
#include <variant>

#include "play/Options.h"

namespace QeltDesktop {

// The program ends at once: what to print, and with which status. Help goes to standard output (status 0),
// wrong usage to standard error (status 2).
struct UsageEnd {
  std::string text;
  int status;
};

// A command line that turns out to be wrong once the page is read.
class WrongUsage : public std::exception {
 public:
  explicit WrongUsage(UsageEnd end) : mEnd(std::move(end)) {}
  const UsageEnd& end() const { return mEnd; }
  const char* what() const noexcept override { return mEnd.text.c_str(); }

 private:
  UsageEnd mEnd;
};

std::variant<Options, UsageEnd> parseOptions(int argc, const char* const* argv);

// The options that a picture depends on, as on a command line.
std::string instructionFor(const Options& options);

// The options as they were asked for; where the command line says nothing, an instruction counts that the
// picture `name` was drawn with. A sheet goes by those that it has itself. Throws Refusal for an instruction
// that has anything but such options, or that does not go with the command line.
Options withInstruction(const Options& asked, const std::string& name, const std::string& instruction);

// Throws WrongUsage where the command line needs more than it says, and the input was no picture that says
// the rest.
void checkWithoutInstruction(const Options& asked);

}  // namespace QeltDesktop
