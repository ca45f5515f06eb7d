// SPDX-License-Identifier: MIT
#pragma once

#include <mutex>
#include <string>
#include <string_view>

#include <Varnel/Platform/Ports/StandardOutput.h>
#include <Varnel/Platform/Ports/SystemLog.h>
#include <Varnel/Platform/Text/VisibleText.h>

namespace Varnel::Platform::Testing {

/// A standard output that keeps what is printed. Any thread.
///
///     CapturedOutput output;
///     …
///     EXPECT_EQ(output.text(), "Will NOT store log\n");
class CapturedOutput final : public StandardOutput {
 public:
  void print(std::string_view text) override {
    const std::lock_guard lock(mutex_);
    text_ += text;
  }

  /// Everything printed so far.
  [[nodiscard]] std::string text() const {
    const std::lock_guard lock(mutex_);
    return text_;
  }

 private:
  mutable std::mutex mutex_;  ///< Owns `text_`.
  std::string text_;
};

/// A system log that keeps its lines, each ended by a line feed. Any thread.
class CapturedSystemLog final : public SystemLog {
 public:
  void write(std::string_view line) override {
    lines_.print(visibleText(std::string(line), Backslashes::kept) + "\n");
  }

  [[nodiscard]] std::string text() const { return lines_.text(); }

 private:
  CapturedOutput lines_;
};

}  // namespace Varnel::Platform::Testing
