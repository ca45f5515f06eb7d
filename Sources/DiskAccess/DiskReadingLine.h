// SPDX-License-Identifier: MIT
#pragma once

#include <array>
#include <compare>
#include <cstddef>
#include <cstdint>
#include <map>
#include <memory>
#include <optional>

#include <Varnel/DiskAccess/DiskData.h>

namespace Varnel {

struct DiskReadingRequest;

/// The requests that wait for one disk, and the order in which it takes them: the most urgent class
/// first and, within a class, on one way up the disk after another. What tells no place is taken at
/// the end of the way. Requests of one place, and all where a seek costs nothing, are taken in the
/// order of coming. One thread at a time.
class DiskReadingLine final {
 public:
  using Request = std::shared_ptr<DiskReadingRequest>;

  enum class Seeks { costTime, costNothing };
  explicit DiskReadingLine(Seeks seeks) : seeks_(seeks) {}

  void add(Request request);
  /// The request stands in the line.
  void remove(const DiskReadingRequest& request);

  [[nodiscard]] std::size_t size() const { return size_; }
  /// The most urgent class that waits.
  [[nodiscard]] std::optional<int> urgency() const;

  /// The next request of the most urgent class, which must be at least as urgent as `urgency`; null
  /// when none is. The second takes it out, and the disk's head with it.
  [[nodiscard]] Request next(int urgency) const;
  [[nodiscard]] Request take(int urgency);

 private:
  struct Key {
    std::uint64_t place;
    std::uint64_t number;
    auto operator<=>(const Key&) const = default;
  };
  [[nodiscard]] Key keyOf(const DiskReadingRequest& request) const;

  const Seeks seeks_;
  std::array<std::map<Key, Request>, urgencyClassCount> classes_;
  std::uint64_t head_ = 0;  ///< Where the disk was read last.
  std::size_t size_ = 0;
};

}  // namespace Varnel
