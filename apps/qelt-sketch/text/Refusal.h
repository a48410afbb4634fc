#pragma once

#include <stdexcept>
#include <string>

namespace QeltDesktop {

// Why the program could not do what it was asked: one line for the person at the terminal. The program
// prints it and leaves with status 1.
class Refusal : public std::runtime_error {
 public:
  using std::runtime_error::runtime_error;
};

// `text` with control characters and bytes that are not UTF-8 written as "\n" or "\x1B": file names may hold
// anything, and a terminal would obey it.
std::string printable(const std::string& text);

// `text` as a part of one line: control characters become spaces, and a long text is cut short.
std::string oneLine(const std::string& text);

}  // namespace QeltDesktop
