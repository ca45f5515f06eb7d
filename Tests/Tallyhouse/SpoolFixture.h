// SPDX-License-Identifier: MIT
#pragma once

#include <memory>
#include <string>
#include <string_view>

#include <gtest/gtest.h>

#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Platform/POSIX/Adapters.h>
#include <Varnel/Platform/Ports/PrivateFiles.h>
#include <Varnel/Platform/SQLite/SQLiteDatabase.h>
#include <Varnel/Platform/Testing/CapturedOutput.h>
#include <Varnel/Platform/Testing/SimulatedClock.h>
#include <Varnel/Tallyhouse/EventRecorder.h>
#include <Varnel/Tallyhouse/EventSpool.h>

namespace Tallyhouse::Tests {

/// What another process does with a database file, until its end.
class OtherConnection final {
 public:
  using Database = Varnel::Platform::SQLiteDatabase;

  OtherConnection(const std::string& path, const std::string& sql)
      : database_(Database::open(path, Database::Access::readWrite).value()) {
    run(sql);
  }

  void run(const std::string& sql) {
    const auto error = database_->execute(sql);
    EXPECT_FALSE(error) << error->localizedDescription();
  }
  void end() { database_.reset(); }

 private:
  std::optional<Database> database_;
};

/// A spool in a folder of its own, and a clock. Each recorder stands for a process.
class SpoolFixture : public testing::Test {
 protected:
  static constexpr std::size_t many = 100'000;

  std::unique_ptr<EventRecorder> openRecorder(SpoolLimits limits = {}) {
    auto recorder =
        std::make_unique<EventRecorder>(EventRecorder::Ports{*files, clock, log}, path(), limits);
    recorder->begin();
    return recorder;
  }
  std::unique_ptr<EventSpool> openSpool() {
    return std::make_unique<EventSpool>(EventSpool::Ports{*files, log}, path());
  }

  [[nodiscard]] std::string path() const { return (folder.path() / "made/Analytics.db").string(); }

  /// Appends events whose UUIDs and texts are these.
  void append(EventRecorder& recorder, std::initializer_list<std::string_view> names) {
    for (const std::string_view name : names)
      recorder.append(name, clock.now(), "ea=" + std::string(name));
  }

  /// The names of what waits, in line.
  static std::string namesOf(EventSpool& spool) {
    std::string names;
    for (const SpooledEvent& event : spool.waiting(many, many)) names += event.uuid + " ";
    return names;
  }
  /// What a process finds that opens the spool now.
  std::string names() { return namesOf(*openSpool()); }

  Varnel::Tests::TemporaryFolder folder = Varnel::Tests::TemporaryFolder::inMemory();
  std::unique_ptr<Varnel::Platform::PrivateFiles> files =
      Varnel::Platform::POSIX::makePrivateFiles();
  Varnel::Platform::Testing::CapturedSystemLog log;
  Varnel::Platform::Testing::SimulatedClock clock{
      Varnel::Platform::Date(std::chrono::hours(500'000))};
};

}  // namespace Tallyhouse::Tests
