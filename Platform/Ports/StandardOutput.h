// SPDX-License-Identifier: MIT
#pragma once

#include <memory>
#include <string_view>

#include <Varnel/Platform/Api.h>

namespace Varnel::Platform {

/// Where the logger prints its entries. Any thread.
class VARNEL_API StandardOutput {
 public:
  virtual ~StandardOutput() = default;
  StandardOutput& operator=(const StandardOutput&) = delete;

  /// Prints the text as it is, with no terminator. Texts of different threads never mix. A stream
  /// that is closed or full, or whose reader has gone, loses the text without a report or a signal;
  /// one that the process began without stays closed, whatever file has its number since.
  /// A slow reader may make the call block.
  virtual void print(std::string_view text) = 0;
};

/// Prints on standard error instead, for hosts whose standard output is their result alone:
///
///     Ports ports = systemPorts();
///     ports.standardOutput = *makeStandardErrorOutput().release();
///     if (!installProcessPorts(ports)) return 1;
///
/// The pointer is released because destructors may log until the process has ended.
[[nodiscard]] VARNEL_API std::unique_ptr<StandardOutput> makeStandardErrorOutput();

}  // namespace Varnel::Platform
