// SPDX-License-Identifier: MIT
#pragma once

#include <cstdlib>
#include <memory>
#include <string>

#include <gtest/gtest.h>

#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Logging/Logger.h>
#include <Varnel/Platform/POSIX/Adapters.h>
#include <Varnel/Platform/Ports/PrivateFiles.h>
#include <Varnel/Platform/Testing/CapturedOutput.h>
#include <Varnel/Platform/Testing/FakeAppendFiles.h>
#include <Varnel/Platform/Testing/FakeTimeZones.h>
#include <Varnel/Platform/Testing/FakeUser.h>
#include <Varnel/Platform/Testing/SimulatedClock.h>

namespace Varnel::Tests {

/// A logger over fakes, in a temporary home, at one moment of 2026.
class LoggerFixture : public testing::Test {
 protected:
  LoggerFixture() {
    ::setenv("TZ", "UTC", 1);
    user.home = home.path().string();
  }

  /// Makes the logger on first use; what it prints at start is left out of `printed()`.
  Logger& logger() {
    if (!logger_) {
      logger_ = std::make_unique<Logger>(
          Logger::Ports{files, clock, *privateFiles, output, zones, user, locale},
          "com.quennel.Test");
      startSize_ = output.text().size();
    }
    return *logger_;
  }

  void destroyLogger() { logger_.reset(); }

  /// What was printed since the logger was made.
  [[nodiscard]] std::string printed() const { return output.text().substr(startSize_); }

  [[nodiscard]] std::string logPath() const {
    return user.home + "/Library/Logs/com.quennel.Test/2026-03-14.log";
  }

  Tests::TemporaryFolder home;
  Platform::Testing::FakeAppendFiles files;
  const std::unique_ptr<Platform::PrivateFiles> privateFiles = Platform::POSIX::makePrivateFiles();
  Platform::Testing::SimulatedClock clock{Platform::Date(
      std::chrono::sys_days(std::chrono::year(2026) / 3 / 14) + std::chrono::seconds(33999))};
  Platform::Testing::CapturedOutput output;
  Platform::Testing::FakeUserAccount user;
  Platform::Testing::FakeTimeZones zones;
  Platform::Testing::FakeUserLocale locale;

 private:
  std::unique_ptr<Logger> logger_;
  std::size_t startSize_ = 0;
};

inline const std::string stamp = "[2026-03-14 09:26:39] ";
inline const std::string nextLine = "\n\t\t\t\t\t";

}  // namespace Varnel::Tests
