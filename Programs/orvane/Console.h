// SPDX-License-Identifier: MIT
#pragma once

#include <atomic>
#include <mutex>
#include <string>
#include <string_view>

namespace Orvane {

/// What the user sees: the result on standard output; complaints, log entries and a line of
/// progress on standard error. Any thread: one lock keeps the texts apart.
///
///     Console console;
///     console.showStatus("12 files");   // stays the last line until it is cleared
///     console.print("An entry.\n");     // appears above it
///     if (!console.writeResult(text)) return 1;
class Console final {
 public:
  Console() = default;
  Console(const Console&) = delete;
  Console& operator=(const Console&) = delete;

  /// Writes text that ends a line to standard error.
  void print(std::string_view text);

  /// Prints "orvane: " and the message on one line, or as many as the terminal needs.
  void complain(std::string_view message);

  /// Writes the result to standard output; complains and returns false when that fails. Says
  /// nothing when the result's reader has gone, which ends programs.
  [[nodiscard]] bool writeResult(std::string_view text);
  [[nodiscard]] bool hasLostReader() const { return hasLostReader_; }

  /// Replaces the status line, and cuts one that is wider than the terminal. Only for terminals.
  void showStatus(const std::string& status);
  void clearStatus() { showStatus({}); }

  /// Erases the status line of any console from the terminal. For signal handlers that end the
  /// program.
  static void eraseStatusInHandler();

 private:
  std::mutex mutex_;
  std::string status_;
  std::atomic<bool> hasLostReader_{false};
};

}  // namespace Orvane
