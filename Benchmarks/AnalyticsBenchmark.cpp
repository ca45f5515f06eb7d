// SPDX-License-Identifier: MIT
// The caller's time for `trackEvent` with eight dimensions, beside the bare insertion of the same
// row with the same durability. The server is not there, so that nothing else touches the spool.
#include <sqlite3.h>

#include <algorithm>
#include <chrono>
#include <cstdlib>
#include <filesystem>
#include <functional>
#include <vector>

#include <Varnel/Platform/POSIX/Adapters.h>
#include <Varnel/Platform/Ports/Clock.h>
#include <Varnel/Platform/Ports/PrivateFiles.h>
#include <Varnel/Platform/Testing/CapturedOutput.h>
#include <Varnel/Platform/Testing/FakeHTTPClient.h>
#include <Varnel/Tallyhouse/AnalyticsTracker.h>
#include <Varnel/Tallyhouse/MeasurementProtocol.h>
#include <Varnel/Tallyhouse/SpoolingTransport.h>
#include <fmt/format.h>

namespace {

namespace fs = std::filesystem;
using namespace Varnel::Platform;

// Rounds shorter than a time slice, so that the median knows nothing of other programs.
constexpr int rounds = 300;
constexpr int repetitions = 25;

const Tallyhouse::CustomDimensions dimensions = {
    "1234567890.1456789012", std::nullopt, "13.0", "3", "12", "40", "1000001", "null"};

// Microseconds a call.
double timeOf(const std::function<void()>& operation) {
  using Clock = std::chrono::steady_clock;
  const auto start = Clock::now();
  for (int i = 0; i < repetitions; ++i) operation();
  const std::chrono::duration<double, std::micro> taken = Clock::now() - start;
  return taken.count() / repetitions;
}

double median(std::vector<double> values) {
  std::nth_element(values.begin(), values.begin() + rounds / 2, values.end());
  return values[rounds / 2];
}

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

}  // namespace

int main() {
  const fs::path folder = fs::temp_directory_path() / "varnel-analytics-benchmark";
  const auto files = POSIX::makePrivateFiles();
  const auto clock = POSIX::makeClock();
  Testing::CapturedSystemLog log;
  Testing::FakeHTTPClient http;
  http.setServer([](const HTTPPost&) { return HTTPFailure{"down"}; });

  fs::remove_all(folder);
  fs::create_directories(folder);
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
  std::vector<double> ours, bare;
  for (int round = 0; round < rounds; ++round) {
    ours.push_back(timeOf([&] {
      tracker.context()->trackEvent("Scan", "Finished", "Pictures", 12, dimensions, {});
    }));
    bare.push_back(timeOf([&] { insertion(); }));
  }
  fmt::print("{:40}{:8.2f} µs\n", "trackEvent, eight dimensions", median(ours));
  fmt::print("{:40}{:8.2f} µs\n", "bare insertion of the same row", median(bare));
  fmt::print("{:40}{:8.2f}     (goal 1.20)\n", "trackEvent to insertion",
             median(ours) / median(bare));
  fs::remove_all(folder);
}
