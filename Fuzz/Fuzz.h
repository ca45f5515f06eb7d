// SPDX-License-Identifier: MIT
// Included by the one source of a fuzzer, which defines `fuzz`.
#pragma once

#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <string_view>
#include <utility>

/// Reads an input that anybody may have written. The fuzzer looks for one that crashes, hangs,
/// leaks or breaks a `require`.
static void fuzz(std::string_view input);

/// Ends the run as a finding when what must hold does not.
inline void require(bool holds) {
  if (!holds) std::abort();
}

/// The input up to the separator, and what is behind it; nothing where there is none.
[[maybe_unused]] static std::pair<std::string_view, std::string_view> cutAt(
    char separator, std::string_view input) {
  const std::size_t end = input.find(separator);
  if (end == std::string_view::npos) return {input, {}};
  return {input.substr(0, end), input.substr(end + 1)};
}

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  fuzz({reinterpret_cast<const char*>(data), size});
  return 0;
}
