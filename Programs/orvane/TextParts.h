// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>
#include <functional>
#include <string>
#include <string_view>

namespace Orvane {

/// Takes the next part of a text, of some 64 kB; false when it could not be written.
using TextWriter = std::function<bool(std::string_view)>;

/// Collects text and hands it on in parts: a result may name millions of files, so its text is
/// never whole in memory.
///
///     TextParts parts(write);
///     for (…) if (!parts.add(line)) return false;
///     return parts.flush();
class TextParts final {
 public:
  /// `write` outlives the object.
  explicit TextParts(const TextWriter& write) : write_(write) {}

  /// False once the writer has failed.
  [[nodiscard]] bool add(std::string_view text) {
    part_ += text;
    return part_.size() < maxPart || flush();
  }

  [[nodiscard]] bool flush() {
    const bool isWritten = write_(part_);
    part_.clear();
    return isWritten;
  }

 private:
  static constexpr std::size_t maxPart = std::size_t{64} << 10;

  const TextWriter& write_;
  std::string part_;
};

}  // namespace Orvane
