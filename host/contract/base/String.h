#pragma once

#include <string>

#include "base/HostApi.h"

namespace Qelt {

// The host's growing text. The virtual destructor lets a posted task delete one that the plug-in made.
class QELT_HOST_API String {
 public:
  String();
  explicit String(const char* text);
  virtual ~String();

  // Each returns false, and leaves the text as it was, when memory runs out.
  bool Append(int number);
  bool Append(char character);
  bool Append(const char* text);

  // Borrowed until the text changes. Chosen here: UTF-8.
  const char* GetText() const;

 private:
  std::string mText;
};

}  // namespace Qelt
