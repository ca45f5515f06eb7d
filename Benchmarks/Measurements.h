// SPDX-License-Identifier: MIT
#pragma once

#include <algorithm>
#include <chrono>
#include <cstddef>
#include <cstdio>
#include <vector>

namespace Varnel::Benchmarks {

using Nanoseconds = double;

/// How long a call takes.
template <typename Function>
Nanoseconds timeOf(Function&& function) {
  const auto start = std::chrono::steady_clock::now();
  function();
  return std::chrono::duration<double, std::nano>(std::chrono::steady_clock::now() - start).count();
}

/// The value below which the given share of the samples lies.
inline Nanoseconds percentile(std::vector<Nanoseconds> samples, double share) {
  std::sort(samples.begin(), samples.end());
  return samples[static_cast<std::size_t>(share * static_cast<double>(samples.size() - 1))];
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

  /// Prints one line with the ratio of the two at the given share, and whether it meets the goal.
  void print(const char* what, double share, double goal) const {
    const Nanoseconds ourTime = percentile(ours, share);
    const Nanoseconds theirTime = percentile(standIn, share);
    const double ratio = ourTime / theirTime;
    std::printf("%-58s %12.1f %12.1f %7.2f %7.2f  %s\n", what, ourTime, theirTime, ratio, goal,
                ratio <= goal ? "met" : "NOT met");
  }

  static void printHeader() {
    std::printf("%-58s %12s %12s %7s %7s\n", "", "ours, ns", "stand-in, ns", "ratio", "goal");
  }
};

}  // namespace Varnel::Benchmarks
