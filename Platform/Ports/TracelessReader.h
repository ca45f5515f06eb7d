// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>
#include <cstdint>
#include <span>
#include <system_error>
#include <vector>

#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/Result.h>

namespace Varnel::Platform {

/// Reads an open file and leaves the system's cache as it was: what was not in it before is given
/// back. For work in the background, which would otherwise crowd out what people work with.
///
///     TracelessReader reader(descriptor);
///     const auto count = reader.read(buffer, offset);
///
/// Where the system cannot do that, or does not tell this user what its cache holds, it just reads.
/// What the system read ahead of a file that is not read to its end may stay. One thread at a time.
class VARNEL_API TracelessReader final {
 public:
  /// The descriptor is that of a regular file, stays the caller's and outlives the reader.
  explicit TracelessReader(int descriptor) : descriptor_(descriptor) {}
  ~TracelessReader();
  TracelessReader(const TracelessReader&) = delete;
  TracelessReader& operator=(const TracelessReader&) = delete;

  /// Reads as many bytes from `offset` on as the buffer holds, or fewer; 0 at the end of the file.
  /// Fails with the system's error (generic category).
  using Count = Result<std::size_t, std::error_code>;
  [[nodiscard]] Count read(std::span<std::byte> buffer, std::uint64_t offset);

 private:
  struct Range {
    std::uint64_t begin;
    std::uint64_t end;
  };
  /// How it reads, from the best way to the one that always works.
  enum class Way {
    droppingBehind,  ///< The system gives back.
    fromCache,       ///< So far all was in the cache.
    noting,          ///< This notes what to give back, before it reads.
  };

  [[nodiscard]] Count readWith(int flags, std::span<std::byte> buffer, std::uint64_t offset) const;
  void noteAbsentRanges(std::uint64_t offset, std::size_t size);

  const int descriptor_;
  Way way_ = Way::droppingBehind;
  Range noted_{};              ///< Where it has noted that.
  std::vector<Range> absent_;  ///< What was not in the cache before.
};

}  // namespace Varnel::Platform
