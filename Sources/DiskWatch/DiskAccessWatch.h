// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <vector>

#include <Varnel/DiskAccess/DiskAccessSnapshot.h>
#include <Varnel/Logging/LoggingObject.h>
#include <Varnel/Platform/Api.h>

namespace Varnel::Platform {
class SessionBoard;
}

namespace Varnel {

class DiskAccessManager;

/// Looks at a manager's disks when it is told to: it names in the log each place that has been held
/// for longer than a minute, once, and posts on the session's board who is where.
/// `DiskAccessWatcher` tells it to. One thread at a time.
class VARNEL_API DiskAccessWatch final : public LoggingObject {
 public:
  using Time = DiskAccessSnapshot::Time;

  /// The manager, the board and the logger outlive it. `program` is its name for the user.
  struct Ports {
    const DiskAccessManager& manager;
    Platform::SessionBoard& board;
    Logger& logger;
  };
  DiskAccessWatch(Ports ports, std::string program);
  /// Withdraws the note.
  ~DiskAccessWatch() override;
  DiskAccessWatch(const DiskAccessWatch&) = delete;
  DiskAccessWatch& operator=(const DiskAccessWatch&) = delete;

  void look(Time now);

  [[nodiscard]] Logger& logger() const override { return ports_.logger; }
  [[nodiscard]] std::string_view logAuthor() const override { return "DiskAccessWatch"; }

 private:
  using Place = DiskAccessSnapshot::Place;

  void warn(const std::vector<DiskAccessSnapshot>& disks, Time now);

  const Ports ports_;
  const std::string program_;
  std::vector<Place> overlong_;  ///< Those of the last look.
  std::string posted_;
};

}  // namespace Varnel
