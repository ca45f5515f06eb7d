// SPDX-License-Identifier: MIT
// The time to abbreviate a path below one of four bases, two a resolver, beside two other ways to
// find the same base of the same two: std::filesystem::mismatch of ready-made paths, and GLib's
// canonical path and its prefix. Ours includes the text that is shown; theirs does where it says
// so.
#include <glib.h>

#include <algorithm>
#include <array>
#include <cstdlib>
#include <filesystem>
#include <string_view>
#include <vector>

#include <Benchmarks/Measurements.h>
#include <Varnel/Paths/QNURLResolver.h>

namespace {

namespace fs = std::filesystem;
using namespace Varnel::Benchmarks;
using Varnel::Platform::URL;

using BasePair = std::array<const char*, 2>;

// Each path has 55 bytes and lies below the base of its own.
struct Case {
  const char* path;
  BasePair bases;
};
constexpr BasePair mine = {"/home/ann", "/media/ann/Backup"};
constexpr BasePair served = {"/srv/archive", "/opt/orvane"};
constexpr std::array<Case, 4> cases = {{
    {"/home/ann/Documents/Letters/2026/To the landlord v2.odt", mine},
    {"/media/ann/Backup/Documents/Letters/2026/Landlord 2.odt", mine},
    {"/srv/archive/Documents/Letters/2026/To the landlord.odt", served},
    {"/opt/orvane/Documents/Letters/2026/To the landlord2.odt", served},
}};
static_assert([] {
  for (const Case& one : cases)
    if (std::string_view(one.path).size() != 55) return false;
  return true;
}());

// Many short rounds: most of them are not interrupted by whatever else runs here.
constexpr int rounds = 401;
constexpr int repetitions = 125;

struct Prepared {
  const char* text;
  const char* const* baseTexts;
  Varnel::QNURLResolver resolver;
  fs::path path;
  std::array<fs::path, 2> bases;
};

std::size_t byResolver(const Prepared& one) {
  return one.resolver.abbreviatedPath(one.text).size();
}

std::size_t byMismatch(const Prepared& one) {
  for (const fs::path& base : one.bases) {
    const auto [end, rest] =
        std::mismatch(base.begin(), base.end(), one.path.begin(), one.path.end());
    if (end == base.end()) return rest == one.path.end() ? 1 : 2;
  }
  return 0;
}

std::size_t byMismatchWithText(const Prepared& one) {
  for (const fs::path& base : one.bases) {
    auto [end, rest] = std::mismatch(base.begin(), base.end(), one.path.begin(), one.path.end());
    if (end != base.end()) continue;
    fs::path text = &base == one.bases.data() ? "~" : "/";
    for (; rest != one.path.end(); ++rest) text /= *rest;
    return text.native().size();
  }
  return 0;
}

std::size_t byGLib(const Prepared& one) {
  char* canonical = g_canonicalize_filename(one.text, "/");
  std::size_t length = 0;
  for (int i = 0; i < 2 && length == 0; ++i) {
    const std::size_t size = std::char_traits<char>::length(one.baseTexts[i]);
    if (!g_str_has_prefix(canonical, one.baseTexts[i]) || canonical[size] != '/') continue;
    char* text = g_strconcat(i == 0 ? "~" : "", canonical + size, nullptr);
    length = std::char_traits<char>::length(text);
    g_free(text);
  }
  g_free(canonical);
  return length;
}

template <typename Operation>
void measure(std::vector<Nanoseconds>& samples, const std::vector<Prepared>& paths,
             Operation operation) {
  std::size_t sum = 0;
  const Nanoseconds time = timeOfOne(repetitions, [&] {
    for (const Prepared& one : paths) sum += operation(one);
  });
  if (sum == 0) std::abort();
  samples.push_back(time / static_cast<double>(paths.size()));
}

}  // namespace

int main() {
  std::vector<Prepared> paths;
  for (const Case& one : cases)
    paths.push_back({.text = one.path,
                     .baseTexts = one.bases.data(),
                     .resolver = Varnel::QNURLResolver(URL::fileURLWithPath(one.bases[0]),
                                                       URL::fileURLWithPath(one.bases[1])),
                     .path = one.path,
                     .bases = {one.bases[0], one.bases[1]}});

  std::vector<Nanoseconds> ours, mismatch, mismatchWithText, canonical;
  for (int round = 0; round < rounds; ++round) {
    measure(ours, paths, byResolver);
    measure(mismatch, paths, byMismatch);
    measure(mismatchWithText, paths, byMismatchWithText);
    measure(canonical, paths, byGLib);
  }
  report("path of 55 bytes, 4 bases / std::filesystem and its text", median(ours),
         median(mismatchWithText), 0.25);
  report("path of 55 bytes, 4 bases / GLib and its text", median(ours), median(canonical), 0.5);
  report("path of 55 bytes, 4 bases / std::filesystem, no text", median(ours), median(mismatch));
}
