// SPDX-License-Identifier: MIT
#include <unistd.h>

#include <algorithm>
#include <barrier>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <functional>
#include <memory>
#include <string>
#include <thread>
#include <vector>

#include <fmt/format.h>
#include <spdlog/async.h>
#include <spdlog/sinks/basic_file_sink.h>
#include <spdlog/sinks/stdout_sinks.h>
#include <spdlog/spdlog.h>

#include <Benchmarks/Measurements.h>
#include <Varnel/Logging/Logger.h>
#include <Varnel/Platform/Ports/Clock.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Testing/FakeUser.h>

// What a log entry of about 105 bytes costs its author, against the work that cannot be avoided and
// against spdlog. Everything prints to /dev/null and writes to a file of its own. Only the ratios
// within one run mean anything.

namespace {

namespace fs = std::filesystem;
using Clock = std::chrono::steady_clock;
using Varnel::Benchmarks::median;
using Varnel::Benchmarks::percentile;
using Log = std::function<void(const std::string& message)>;

constexpr int rounds = 7;
constexpr int messagesPerThread = 100'000;
constexpr int bursts = 300;
constexpr int shortBurst = 100;
constexpr int longBurst = 1000;
const std::string author = "DuplicateScanner";
const std::string message = "Did compare two files of the same size and found them equal: scan.pdf";

/// The returned function keeps the log open.
using Opening = Log (*)(const fs::path& folder);

double nanosecondsSince(Clock::time_point start) {
  return std::chrono::duration<double, std::nano>(Clock::now() - start).count();
}

// The mean time of one message on one thread.
double callerTime(const Log& log, int threads) {
  std::barrier start(threads);
  std::vector<double> times(static_cast<std::size_t>(threads));
  {
    std::vector<std::jthread> callers;
    for (double& time : times)
      callers.emplace_back([&] {
        start.arrive_and_wait();
        const auto begin = Clock::now();
        for (int i = 0; i < messagesPerThread; ++i) log(message);
        time = nanosecondsSince(begin) / messagesPerThread;
      });
  }
  return median(times);
}

// The time that all but one in a hundred bursts stay below.
double burstTime(const Log& log, int messages) {
  std::vector<double> times;
  for (int i = 0; i < bursts; ++i) {
    const auto begin = Clock::now();
    for (int j = 0; j < messages; ++j) log(message);
    times.push_back(nanosecondsSince(begin));
    std::this_thread::sleep_for(std::chrono::milliseconds(2));
  }
  return percentile(std::move(times), 0.99);
}

// Formats an entry and writes it twice, nothing else.
Log openRequiredWork(const fs::path& folder) {
  using File = std::unique_ptr<std::FILE, int (*)(std::FILE*)>;
  const auto file =
      std::make_shared<File>(std::fopen((folder / "required.log").c_str(), "a"), &std::fclose);
  return [file](const std::string& text) {
    const auto now = Varnel::Platform::processPorts().clock.get().now();
    fmt::memory_buffer entry;
    fmt::format_to(std::back_inserter(entry), "[{}] {}:  {}\n",
                   Varnel::Logger::logMessageDateFormatter().string(now), author, text);
    std::fwrite(entry.data(), 1, entry.size(), stdout);
    std::fwrite(entry.data(), 1, entry.size(), file->get());
  };
}

Log openLogger(const fs::path& folder) {
  static Varnel::Platform::Testing::FakeUserAccount user;
  user.home = folder.string();
  const auto& ports = Varnel::Platform::processPorts();
  const auto logger = std::make_shared<Varnel::Logger>(
      Varnel::Logger::Ports{ports.appendFiles, ports.clock, ports.privateFiles,
                            ports.standardOutput, ports.timeZones, user, ports.userLocale},
      "benchmark");
  return [logger](const std::string& text) { logger->log(text, author); };
}

template <typename Kind, typename... Pool>
Log openPeer(const fs::path& path, Pool&&... pool) {
  const auto file = std::make_shared<spdlog::sinks::basic_file_sink_mt>(path.string());
  const spdlog::sinks_init_list sinks = {std::make_shared<spdlog::sinks::stdout_sink_mt>(), file};
  const auto peer = std::make_shared<Kind>(author, sinks, pool...);
  peer->set_pattern("[%Y-%m-%d %H:%M:%S] %n:  %v");
  return [peer, ... kept = pool](const std::string& text) { peer->info(text); };
}

Log openSynchronousPeer(const fs::path& folder) {
  return openPeer<spdlog::logger>(folder / "synchronous.log");
}

Log openAsynchronousPeer(const fs::path& folder) {
  return openPeer<spdlog::async_logger>(folder / "asynchronous.log",
                                        std::make_shared<spdlog::details::thread_pool>(8192, 1));
}

struct Figures {
  std::vector<double> oneThread;
  std::vector<double> twoThreads;
  std::vector<double> shortBursts;
  std::vector<double> longBursts;
};

}  // namespace

int main() {
  enum : std::size_t { required, ours, asynchronous, synchronous, subjectCount };
  const Opening subjects[subjectCount] = {openRequiredWork, openLogger, openAsynchronousPeer,
                                          openSynchronousPeer};

  std::fflush(stdout);
  const int terminal = ::dup(STDOUT_FILENO);
  if (!std::freopen("/dev/null", "w", stdout)) return EXIT_FAILURE;
  const fs::path folder = fs::temp_directory_path() / "varnel-logger-benchmark";
  Figures figures[subjectCount];
  for (int round = 0; round < rounds; ++round) {
    for (std::size_t i = 0; i < subjectCount; ++i) {
      fs::remove_all(folder);
      fs::create_directories(folder);
      const Log log = subjects[i](folder);
      figures[i].oneThread.push_back(callerTime(log, 1));
      figures[i].twoThreads.push_back(callerTime(log, 2));
      figures[i].shortBursts.push_back(burstTime(log, shortBurst));
      figures[i].longBursts.push_back(burstTime(log, longBurst));
    }
  }
  fs::remove_all(folder);

  std::fflush(stdout);
  ::dup2(terminal, STDOUT_FILENO);
  const auto report = [&](const char* what, auto figure, std::size_t peer,
                          std::optional<double> goal = std::nullopt) {
    Varnel::Benchmarks::report(what, median(figures[ours].*figure), median(figures[peer].*figure),
                               goal);
  };
  report("log entry, 1 thread / required work", &Figures::oneThread, required, 0.8);
  report("log entry, 2 threads / required work", &Figures::twoThreads, required, 0.7);
  report("log entry, 1 thread / asynchronous spdlog", &Figures::oneThread, asynchronous, 0.25);
  report("log entry, 2 threads / asynchronous spdlog", &Figures::twoThreads, asynchronous, 0.25);
  report("bursts of 100 entries, p99 / asynchronous spdlog", &Figures::shortBursts, asynchronous,
         1.0);
  report("bursts of 1000 entries, p99 / asynchronous spdlog", &Figures::longBursts, asynchronous,
         1.0);
  report("bursts of 100 entries, p99 / required work", &Figures::shortBursts, required);
  report("bursts of 1000 entries, p99 / required work", &Figures::longBursts, required);
  report("log entry, 1 thread / synchronous spdlog", &Figures::oneThread, synchronous);
}
