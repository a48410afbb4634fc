#pragma once

#include <exception>
#include <string>

namespace Qelt {

// An operation that the object is in no state for.
class NotSupportedException : public std::exception {
 public:
  explicit NotSupportedException(const std::string& message) : mMessage(message) {}
  const char* what() const noexcept override { return mMessage.c_str(); }

 private:
  std::string mMessage;
};

// A value of the wrong kind.
class InvalidArgumentException : public std::exception {
 public:
  explicit InvalidArgumentException(const std::string& message) : mMessage(message) {}
  const char* what() const noexcept override { return mMessage.c_str(); }

 private:
  std::string mMessage;
};

}  // namespace Qelt
