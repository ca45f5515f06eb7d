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
/// first and, within a class, in one sweep up the disk after another. What tells no place is taken
/// at the end of a sweep. Requests of one place, and all where a seek costs nothing, are taken in
/// the order of coming. A request that comes back to where the class was read last, or below, waits
/// for the next sweep. So everybody gets there. One thread at a time.
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
  /// when none is. The second takes it out, and its class goes on from there.
  [[nodiscard]] Request next(int urgency) const;
  [[nodiscard]] Request take(int urgency);

 private:
  struct Key {
    std::uint64_t sweep;
    std::uint64_t place;
    std::uint64_t number;
    auto operator<=>(const Key&) const = default;
  };
  struct Class {
    std::map<Key, Request> requests;
    std::uint64_t sweep = 0;
    std::optional<std::uint64_t> head;  ///< Where it was read last; none before the first.
  };
  [[nodiscard]] std::uint64_t placeOf(const DiskReadingRequest& request) const;
  [[nodiscard]] Key keyOf(const DiskReadingRequest& request) const;
  [[nodiscard]] Class& classOf(const DiskReadingRequest& request);

  const Seeks seeks_;
  std::array<Class, urgencyClassCount> classes_;
  std::size_t size_ = 0;
};

}  // namespace Varnel
