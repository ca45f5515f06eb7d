// SPDX-License-Identifier: MIT
#pragma once

#include <algorithm>
#include <chrono>
#include <cstddef>
#include <latch>
#include <mutex>
#include <optional>
#include <string>
#include <string_view>
#include <thread>
#include <vector>

#include <fmt/format.h>

namespace Varnel::Benchmarks {

using Nanoseconds = double;

/// How long a call takes.
template <typename Function>
Nanoseconds timeOf(Function&& function) {
  const auto start = std::chrono::steady_clock::now();
  function();
  return std::chrono::duration<double, std::nano>(std::chrono::steady_clock::now() - start).count();
}

/// How long one of so many calls takes.
template <typename Function>
Nanoseconds timeOfOne(int calls, Function&& function) {
  return timeOf([&] {
           for (int i = 0; i < calls; ++i) function();
         }) /
         calls;
}

/// The time from one call to the next when so many threads make so many each at once.
template <typename Function>
Nanoseconds timeOfOneAmong(int threadCount, int calls, Function&& function) {
  using Time = std::chrono::steady_clock::time_point;
  std::latch ready(threadCount);
  std::mutex mutex;
  Time begin = Time::max();
  Time end = Time::min();
  std::vector<std::thread> threads;
  for (int i = 0; i < threadCount; ++i) {
    threads.emplace_back([&] {
      ready.arrive_and_wait();
      const Time own = std::chrono::steady_clock::now();
      for (int call = 0; call < calls; ++call) function();
      const Time now = std::chrono::steady_clock::now();
      const std::lock_guard lock(mutex);
      begin = std::min(begin, own);
      end = std::max(end, now);
    });
  }
  for (std::thread& thread : threads) thread.join();
  return std::chrono::duration<double, std::nano>(end - begin).count() /
         (static_cast<double>(calls) * threadCount);
}

/// The value below which the given share of the samples lies.
inline double percentile(std::vector<double> samples, double share) {
  std::sort(samples.begin(), samples.end());
  return samples[static_cast<std::size_t>(share * static_cast<double>(samples.size() - 1))];
}

inline double median(std::vector<double> samples) {
  return percentile(std::move(samples), 0.5);
}

/// Three digits or more: "0.27", "35.1", "1204".
inline std::string textOf(double value) {
  return fmt::format("{:.{}f}", value, value < 10 ? 2 : value < 1000 ? 1 : 0);
}

/// Prints one figure: ours, what stands beside it, their ratio, and what the ratio may be at most.
/// `what` names both. `Benchmarks/run` reads the lines of all benchmarks; at least two spaces part
/// their columns. figures.py prints the same.
inline void report(std::string_view what, double ours, double standIn,
                   std::optional<double> goal = std::nullopt, std::string_view unit = "ns") {
  const double ratio = ours / standIn;
  if (unit == "ns") {
    for (const std::string_view larger : {"µs", "ms", "s"}) {
      if (standIn < 1000) break;
      ours /= 1000;
      standIn /= 1000;
      unit = larger;
    }
  }
  fmt::print("{:<64}  {:>8} {:<2}  {:>8} {:<2}  {:>6.2f}  {:>6}  {}\n", what, textOf(ours), unit,
             textOf(standIn), unit, ratio, goal ? fmt::format("{:.2f}", *goal) : "-",
             !goal            ? ""
             : ratio <= *goal ? "met"
                              : "missed");
}

/// Both sides of a comparison, measured in turns so that both meet the same weather.
struct Comparison {
  std::vector<Nanoseconds> ours;
  std::vector<Nanoseconds> standIn;

  template <typename Ours, typename StandIn>
  void measure(std::size_t rounds, Ours&& measureOurs, StandIn&& measureStandIn) {
    for (std::size_t round = 0; round < rounds; ++round) {
      ours.push_back(measureOurs());
      standIn.push_back(measureStandIn());
    }
  }

  /// Reports the two at the given share of their samples.
  void report(std::string_view what, double share, double goal) const {
    Benchmarks::report(what, percentile(ours, share), percentile(standIn, share), goal);
  }
};

}  // namespace Varnel::Benchmarks
