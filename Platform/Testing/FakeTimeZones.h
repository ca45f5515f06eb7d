// SPDX-License-Identifier: MIT
#pragma once

#include <chrono>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include <Varnel/Platform/Ports/TimeZones.h>

namespace Varnel::Platform::Testing {

/// Time zones as the test sets them. Set them before other threads read.
///
///     FakeTimeZones zones;
///     zones.local = "Europe/Berlin";
///     zones.changes["Europe/Berlin"] = {{winterBegin, {1h}}, {summerBegin, {2h, true}}};
class FakeTimeZones final : public TimeZones {
 public:
  /// A moment from which another offset counts.
  struct Change {
    Date begin;
    TimeZone::Offset offset;
  };

  std::string local = "UTC";
  /// The changes of each zone, in the order of time. Before the first one, and in other zones, the
  /// clocks show UTC. A user in another zone is in UTC.
  std::map<std::string, std::vector<Change>> changes;

  [[nodiscard]] std::string localIdentifier() const override {
    return changes.contains(local) ? local : "UTC";
  }
  [[nodiscard]] std::shared_ptr<const TimeZone> zone(const std::string& identifier) const override {
    const auto found = changes.find(identifier);
    return std::make_shared<Zone>(found == changes.end() ? std::vector<Change>() : found->second);
  }

 private:
  class Zone final : public TimeZone {
   public:
    explicit Zone(std::vector<Change> changes) : changes_(std::move(changes)) {}

    [[nodiscard]] Offset offsetAt(Date date) const override {
      Offset offset;
      for (const Change& change : changes_)
        if (change.begin <= date) offset = change.offset;
      return offset;
    }
    [[nodiscard]] std::optional<Date> nextChange(Date date) const override {
      for (const Change& change : changes_)
        if (change.begin > date) return change.begin;
      return std::nullopt;
    }

   private:
    const std::vector<Change> changes_;
  };
};

}  // namespace Varnel::Platform::Testing
