// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <string>

#include <orvane/Command.h>

namespace Orvane {

/// Reads a size as people write it into `bytes`: a whole number, and perhaps a unit. "4096", "10M"
/// and "10 MB" (which count by 1000, as in the results), "4KiB" (which counts by 1024). Letters may
/// be small or capital.
[[nodiscard]] Complaint readSize(const std::string& text, std::uint64_t& bytes);

}  // namespace Orvane
