// SPDX-License-Identifier: MIT
#pragma once

#include <cstdlib>
#include <memory>
#include <string>

#include <gtest/gtest.h>

#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Logging/Logger.h>
#include <Varnel/Platform/Testing/FakePorts.h>

namespace Varnel::Tests {

/// A logger over fakes, in a temporary home, at one moment of 2026.
class LoggerFixture : public testing::Test {
 protected:
  LoggerFixture() {
    ::setenv("TZ", "UTC", 1);
    fakes.userAccount.home = home.path().string();
    fakes.clock.set(Platform::Date(std::chrono::sys_days(std::chrono::year(2026) / 3 / 14) +
                                   std::chrono::seconds(33999)));
  }

  /// Makes the logger on first use; what it prints at start is left out of `printed()`.
  Logger& logger() {
    if (!logger_) {
      logger_ = std::make_unique<Logger>(fakes.ports(), "com.quennel.Test");
      startSize_ = fakes.standardOutput.text().size();
    }
    return *logger_;
  }

  void destroyLogger() { logger_.reset(); }

  /// What was printed since the logger was made.
  [[nodiscard]] std::string printed() const {
    return fakes.standardOutput.text().substr(startSize_);
  }

  [[nodiscard]] std::string logPath() const {
    return fakes.userAccount.home + "/Library/Logs/com.quennel.Test/2026-03-14.log";
  }

  Tests::TemporaryFolder home;
  Platform::Testing::FakePorts fakes;

 private:
  std::unique_ptr<Logger> logger_;
  std::size_t startSize_ = 0;
};

inline const std::string stamp = "[2026-03-14 09:26:39] ";
inline const std::string nextLine = "\n\t\t\t\t\t";

}  // namespace Varnel::Tests
