// SPDX-License-Identifier: MIT
#include <orvane/Console.h>

#include <utility>

#include <Varnel/Platform/Text/VisibleText.h>
#include <orvane/ShownText.h>
#include <orvane/StandardStreams.h>
#include <orvane/TextColumns.h>

namespace Orvane {
namespace {

using Varnel::Platform::visibleText;

constexpr std::string_view eraseLine = "\r\x1b[K";

std::atomic<bool> isStatusShown{false};

}  // namespace

void Console::print(std::string_view text) {
  const std::lock_guard lock(mutex_);
  if (status_.empty()) return writeStandardError(text);
  writeStandardError(std::string(eraseLine).append(text).append(status_));
}

void Console::complain(std::string_view message) {
  print(wrapped("orvane: " + visibleText(std::string(message)) + "\n",
                isStandardErrorATerminal() ? standardErrorColumns() : 0));
}

bool Console::writeResult(std::string_view text) {
  const std::error_code error = writeStandardOutput(text);
  if (error == std::errc::broken_pipe && closedPipesEnd()) {
    hasLostReader_ = true;
  } else if (error) {
    complain("cannot write the result: " + error.message());
  }
  return !error;
}

void Console::eraseStatusInHandler() {
  if (isStatusShown) writeStandardErrorInHandler(eraseLine);
}

void Console::showStatus(const std::string& status) {
  const std::lock_guard lock(mutex_);
  // One that fills the last column would go on in the next line on some terminals, and stay there.
  std::string line = fitted(status, standardErrorColumns() - 1);
  if (line == status_) return;
  status_ = std::move(line);
  isStatusShown = !status_.empty();
  writeStandardError(std::string(eraseLine) + status_);
}

}  // namespace Orvane
