// SPDX-License-Identifier: MIT
#pragma once

#include <string_view>

#include <Platform/Api.h>

namespace Varnel::Platform {

/// Where the logger prints its entries. Any thread.
class VARNEL_API StandardOutput {
 public:
  virtual ~StandardOutput() = default;

  /// Prints the text as it is, with no terminator. Texts of different threads never mix. A stream
  /// that is closed or full loses the text without a word.
  virtual void print(std::string_view text) = 0;
};

}  // namespace Varnel::Platform
