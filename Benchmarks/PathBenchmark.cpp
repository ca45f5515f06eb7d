// SPDX-License-Identifier: MIT
// The time to abbreviate a path below the last of four bases, beside two ways of only finding that
// base: std::filesystem::mismatch of ready-made paths, and GLib's canonical path and its prefix.
#include <glib.h>

#include <algorithm>
#include <array>
#include <chrono>
#include <cstdio>
#include <filesystem>
#include <string>
#include <string_view>
#include <vector>

#include <Varnel/Paths/QNURLResolver.h>

namespace {

namespace fs = std::filesystem;
using Varnel::Platform::URL;

constexpr std::string_view path = "/srv/archive/Documents/Letters/2026/To the landlord.odt";
static_assert(path.size() == 55);
constexpr std::array<const char*, 4> bases = {"/home/ann", "/media/ann/Backup", "/opt/orvane",
                                              "/srv/archive"};

constexpr int rounds = 21;
constexpr int repetitions = 20'000;

// Nanoseconds a call.
template <typename Operation>
double timeOf(Operation operation) {
  using Clock = std::chrono::steady_clock;
  std::size_t sum = 0;
  const auto start = Clock::now();
  for (int i = 0; i < repetitions; ++i) sum += operation();
  const std::chrono::duration<double, std::nano> taken = Clock::now() - start;
  if (sum == 0) std::puts("(nothing was found)");
  return taken.count() / repetitions;
}

double median(std::vector<double> values) {
  std::nth_element(values.begin(), values.begin() + rounds / 2, values.end());
  return values[rounds / 2];
}

std::size_t byMismatch(const fs::path& whole, const std::array<fs::path, 4>& candidates) {
  for (const fs::path& base : candidates) {
    const auto [end, rest] = std::mismatch(base.begin(), base.end(), whole.begin(), whole.end());
    if (end == base.end()) return static_cast<std::size_t>(std::distance(rest, whole.end()));
  }
  return 0;
}

std::size_t byGLib(const char* whole) {
  char* canonical = g_canonicalize_filename(whole, "/");
  std::size_t length = 0;
  for (const char* base : bases) {
    const std::size_t size = std::char_traits<char>::length(base);
    if (g_str_has_prefix(canonical, base) && (canonical[size] == '/' || canonical[size] == '\0')) {
      length = std::char_traits<char>::length(canonical) - size;
      break;
    }
  }
  g_free(canonical);
  return length;
}

void print(const char* peer, double ours, double theirs, double goal) {
  std::printf("%-52s %8.1f %8.1f %7.2f  goal %.2f  %s\n", peer, ours, theirs, ours / theirs, goal,
              ours <= goal * theirs ? "met" : "MISSED");
}

}  // namespace

int main() {
  // Two resolvers have four bases; the first one finds none of its own.
  const Varnel::QNURLResolver first(URL::fileURLWithPath(bases[0]), URL::fileURLWithPath(bases[1]));
  const Varnel::QNURLResolver second(URL::fileURLWithPath(bases[2]),
                                     URL::fileURLWithPath(bases[3]));
  const fs::path whole(path);
  const std::array<fs::path, 4> candidates = {bases[0], bases[1], bases[2], bases[3]};

  std::vector<double> ours, mismatches, canonical;
  for (int round = 0; round < rounds; ++round) {
    ours.push_back(timeOf(
        [&] { return first.abbreviatedPath(path).size() + second.abbreviatedPath(path).size(); }));
    mismatches.push_back(timeOf([&] { return byMismatch(whole, candidates); }));
    canonical.push_back(timeOf([&] { return byGLib(path.data()); }));
  }
  std::printf("%-52s %8s %8s %7s\n", "abbreviating, 4 bases, 55 bytes; ns a path", "ours", "peer",
              "ratio");
  print("std::filesystem, mismatch of ready-made paths", median(ours), median(mismatches), 0.25);
  print("GLib, canonicalize and compare prefixes", median(ours), median(canonical), 0.5);
}
