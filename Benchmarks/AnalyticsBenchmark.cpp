// SPDX-License-Identifier: MIT
// The caller's time for `trackEvent` with eight dimensions, beside the bare insertion of the same
// row with the same durability, and while the file is locked. The server is not there, so that
// nothing else touches the spool.
#include <sqlite3.h>

#include <chrono>
#include <cstdlib>
#include <filesystem>
#include <vector>

#include <Benchmarks/Measurements.h>
#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Platform/POSIX/Adapters.h>
#include <Varnel/Platform/Ports/Clock.h>
#include <Varnel/Platform/Ports/PrivateFiles.h>
#include <Varnel/Platform/Testing/CapturedOutput.h>
#include <Varnel/Platform/Testing/FakeHTTPClient.h>
#include <Varnel/Tallyhouse/AnalyticsTracker.h>
#include <Varnel/Tallyhouse/MeasurementProtocol.h>
#include <Varnel/Tallyhouse/SpoolingTransport.h>

namespace {

namespace fs = std::filesystem;
using namespace Varnel::Benchmarks;
using namespace Varnel::Platform;

// Rounds shorter than a time slice, so that the median knows nothing of other programs.
constexpr int rounds = 300;
constexpr int repetitions = 25;

const Tallyhouse::CustomDimensions dimensions = {
    "1234567890.1456789012", std::nullopt, "13.0", "3", "12", "40", "1000001", "null"};

void require(int status) {
  if (status != SQLITE_OK && status != SQLITE_DONE) std::abort();
}

// What a program would write that only wants the row to outlive its process.
class BareInsertion {
 public:
  explicit BareInsertion(const fs::path& path) {
    require(::sqlite3_open(path.c_str(), &database_));
    require(::sqlite3_exec(database_,
                           "PRAGMA journal_mode = WAL; PRAGMA synchronous = NORMAL;"
                           "PRAGMA wal_autocheckpoint = 8000;"
                           "CREATE TABLE event(id INTEGER PRIMARY KEY, uuid TEXT NOT NULL,"
                           " date INTEGER NOT NULL, hit TEXT NOT NULL);",
                           nullptr, nullptr, nullptr));
    require(::sqlite3_prepare_v2(database_, "INSERT INTO event(uuid, date, hit) VALUES(?, ?, ?)",
                                 -1, &insert_, nullptr));
    hit_ = Tallyhouse::encodedHit({.uuid = {},
                                   .date = {},
                                   .category = "Scan",
                                   .action = "Finished",
                                   .label = "Pictures",
                                   .value = 12,
                                   .customDimensions = dimensions,
                                   .customMetrics = {}},
                                  {"QN-1", "1234567890.1456789012"});
  }
  ~BareInsertion() {
    ::sqlite3_finalize(insert_);
    ::sqlite3_close(database_);
  }
  BareInsertion(const BareInsertion&) = delete;
  BareInsertion& operator=(const BareInsertion&) = delete;

  void operator()() {
    require(
        ::sqlite3_bind_text(insert_, 1, "6F1C0E5A-2F8E-4C0B-9B1B-7B9D4E2A8C11", -1, SQLITE_STATIC));
    require(::sqlite3_bind_int64(insert_, 2, 1'700'000'000'000'000));
    require(::sqlite3_bind_text(insert_, 3, hit_.c_str(), static_cast<int>(hit_.size()),
                                SQLITE_STATIC));
    require(::sqlite3_step(insert_));
    require(::sqlite3_reset(insert_));
  }

 private:
  sqlite3* database_ = nullptr;
  sqlite3_stmt* insert_ = nullptr;
  std::string hit_;
};

// Holds the file's lock, as another process would.
class OtherProcess {
 public:
  explicit OtherProcess(const fs::path& path) {
    require(::sqlite3_open(path.c_str(), &database_));
    require(::sqlite3_exec(database_, "BEGIN IMMEDIATE", nullptr, nullptr, nullptr));
  }
  ~OtherProcess() { ::sqlite3_close(database_); }
  OtherProcess(const OtherProcess&) = delete;
  OtherProcess& operator=(const OtherProcess&) = delete;

 private:
  sqlite3* database_ = nullptr;
};

}  // namespace

int main() {
  // Declared first, so that it goes last: the tracker makes anew what it finds gone.
  const Varnel::Tests::TemporaryFolder temporary;
  const fs::path& folder = temporary.path();
  const auto files = POSIX::makePrivateFiles();
  const auto clock = POSIX::makeClock();
  Testing::CapturedSystemLog log;
  Testing::FakeHTTPClient http;
  http.setServer([](const HTTPPost&) { return HTTPFailure{"down"}; });

  Tallyhouse::DeliveryPolicy patient;
  patient.linger = std::chrono::hours(1);
  patient.firstRetry = std::chrono::hours(1);
  Tallyhouse::AnalyticsTracker tracker(
      Tallyhouse::SpoolingTransport::make({*clock, http, *files, log},
                                          {.endpoint = *URL::parse("https://h.example/batch"),
                                           .trackingID = "QN-1",
                                           .clientID = "1234567890.1456789012",
                                           .spoolPath = folder / "Analytics.db",
                                           .policy = patient}),
      Tallyhouse::Consent::granted);
  BareInsertion insertion(folder / "bare.db");
  const auto track = [&] {
    tracker.context()->trackEvent("Scan", "Finished", "Pictures", 12, dimensions, {});
  };
  Comparison comparison;
  comparison.measure(
      rounds, [&] { return timeOfOne(repetitions, track); },
      [&] { return timeOfOne(repetitions, [&] { insertion(); }); });
  comparison.report("trackEvent, eight dimensions / bare insertion", 0.5, 1.2);

  const OtherProcess other(folder / "Analytics.db");
  std::vector<Nanoseconds> waits;
  for (int i = 0; i < repetitions; ++i) waits.push_back(timeOf(track));
  report("trackEvent, file locked by others, worst / 20 ms", percentile(waits, 1), 20e6, 1.0);
}
