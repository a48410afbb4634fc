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

// `text` with its control characters, and what is no UTF-8, as "\n" or "\x1B": file names hold anything, and
// a terminal obeys it.
std::string printable(const std::string& text);

// `text` as a part of one line: control characters become spaces, a long text is cut.
std::string oneLine(const std::string& text);

}  // namespace QeltDesktop
