// SPDX-License-Identifier: MIT
#pragma once

#include <array>
#include <compare>
#include <cstdint>
#include <limits>

#include <Scan/FileTree.h>

namespace Orvane {

/// 128 bits that stand for some bytes, under the secret of one scan.
using Digest = std::array<std::uint64_t, 2>;

/// A file that may have a duplicate. One of the few things there are a million of.
struct Candidate {
  static constexpr FileNumber lost = std::numeric_limits<FileNumber>::max();
  static constexpr std::int64_t unread = std::numeric_limits<std::int64_t>::min();

  FileNumber file;          ///< `lost` once it cannot take part.
  std::uint32_t group = 0;  ///< Files of different groups are known to differ.
  /// By turns where the file lies (device and inode, or place), and the digest of what was read.
  std::array<std::uint64_t, 2> key{};
  std::int64_t modifiedAt = unread;  ///< In nanoseconds since 1970, as the last look saw it.
};

/// What is read of files, in the order in which files are told apart. No two of the first three
/// show the same byte, so files that agree in all of them are equal, and nothing is read twice.
enum class Look {
  head,         ///< The beginning.
  samples,      ///< Some of the middle and the end, for those that are large.
  rest,         ///< All that the looks before have not shown.
  headAndRest,  ///< For those that fit into a block.
};

/// How much of a file is looked at first. The system reads this much in one go anyway, and most
/// files are not larger.
constexpr std::uint64_t headLength = std::uint64_t{16} << 10;

/// From this size on, a look at samples costs little beside reading everything, even on a disk that
/// reads five megabytes in the time of the look's two seeks.
constexpr std::uint64_t worthSamples = std::uint64_t{8} << 20;

}  // namespace Orvane
