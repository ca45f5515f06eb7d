// SPDX-License-Identifier: MIT
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <optional>
#include <vector>

#include <Scan/ContentStream.h>

namespace Orvane {

struct ScanControl;

/// A 128-bit digest of some bytes. Equal digests make equal bytes likely but never certain:
/// different contents with one digest can be made on purpose.
using Digest = std::array<std::uint64_t, 2>;

/// The outcome of the comparison of two files.
struct Comparison {
  bool isEqual = false;
  std::optional<Loss> firstLoss{};
  std::optional<Loss> secondLoss{};
};

/// Reads contents for one worker, with ports and buffers that it uses over and over. It counts what
/// it reads. Once asked to stop, it stops at the next block, and its result is of no use. One
/// thread at a time.
class ContentReader final {
 public:
  using DigestResult = Varnel::Platform::Result<Digest, Loss>;

  /// `control` outlives the reader.
  ContentReader(ContentStream::Ports ports, ScanControl& control);

  /// The digest of the file's first `length` bytes, or of all if it has fewer.
  [[nodiscard]] DigestResult digest(const FileRecord& file, std::uint64_t length);

  /// Compares two files of one size byte by byte, as far as the first difference.
  [[nodiscard]] Comparison compare(const FileRecord& first, const FileRecord& second);

 private:
  ContentStream::Block readBlock(ContentStream& stream, std::vector<std::byte>& buffer);

  ContentStream::Ports ports_;
  ScanControl& control_;
  std::vector<std::byte> firstBuffer_;
  std::vector<std::byte> secondBuffer_;
};

}  // namespace Orvane
