// SPDX-License-Identifier: MIT
#pragma once

#include <memory>
#include <string>
#include <string_view>

#include <gtest/gtest.h>

#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Platform/POSIX/Adapters.h>
#include <Varnel/Platform/Ports/AppendFiles.h>
#include <Varnel/Platform/Testing/CapturedOutput.h>
#include <Varnel/Platform/Testing/SimulatedClock.h>
#include <Varnel/Tallyhouse/EventSpool.h>

namespace Tallyhouse::Tests {

/// A spool in a folder of its own, and a clock.
class SpoolFixture : public testing::Test {
 protected:
  std::unique_ptr<EventSpool> openSpool(SpoolLimits limits = {}) {
    return std::make_unique<EventSpool>(EventSpool::Ports{*files, log}, path(), limits);
  }

  [[nodiscard]] std::string path() const { return (folder.path() / "made/Analytics.db").string(); }

  /// Appends events whose UUIDs and texts are these.
  void append(EventSpool& spool, std::initializer_list<std::string_view> names) {
    for (const std::string_view name : names)
      spool.append(name, clock.now(), "ea=" + std::string(name));
  }

  /// The names of what waits, in line.
  static std::string namesOf(EventSpool& spool) {
    std::string names;
    for (const SpooledEvent& event : spool.waiting(1000, 1 << 20)) names += event.uuid + " ";
    return names;
  }

  Varnel::Tests::TemporaryFolder folder;
  std::unique_ptr<Varnel::Platform::AppendFiles> files = Varnel::Platform::POSIX::makeAppendFiles();
  Varnel::Platform::Testing::CapturedSystemLog log;
  Varnel::Platform::Testing::SimulatedClock clock{
      Varnel::Platform::Date(std::chrono::hours(500'000))};
};

}  // namespace Tallyhouse::Tests
