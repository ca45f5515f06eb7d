// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include <Varnel/Platform/Ports/PrivateFiles.h>
#include <Varnel/Tallyhouse/DeliveryPolicy.h>
#include <Varnel/Tallyhouse/SpoolFormat.h>

namespace Tallyhouse {

/// Where the delivery to a server stands: for all processes that share the spool, and for the next
/// ones.
struct DeliveryState final {
  std::string server;
  std::optional<Date> notBefore;          ///< The end of the pause, if there is one.
  Obstacle obstacle = Obstacle::network;  ///< Of the last failure.
  int failures = 0;                       ///< In a row by this obstacle.
};

/// What a deliverer has to know before it sends.
struct SpoolOutlook final {
  Backlog backlog;
  DeliveryState state;
};

/// What became of a batch, and the state of the delivery since.
struct DeliveryOutcome final {
  std::vector<SpooledEvent> events;
  Verdict verdict = Verdict::later;
  Date date;
  DeliveryState state;
};

/// The spool as its deliverer sees it: events in line, and those that the server refused, which
/// have left the line so that they do not hold up the others, and are tried alone until they are
/// set aside for good. All of them count towards the limits.
///
/// One thread at a time; processes that share the file elect one deliverer. No operation waits more
/// than 20 ms for a lock.
class EventSpool final {
 public:
  using Ports = DurableFile::Ports;

  EventSpool(Ports ports, std::string path);

  /// Makes this the one deliverer, until the lock goes. Null when there is another. The system's
  /// log is told once of an error: nobody delivers then.
  [[nodiscard]] Varnel::Platform::Result<std::unique_ptr<Varnel::Platform::FileLock>> elect();

  /// Absent when the file cannot be had. Counts the waiting events up to `maxEvents`; the state is
  /// that of the server.
  [[nodiscard]] std::optional<SpoolOutlook> look(const std::string& server, std::size_t maxEvents,
                                                 int maxRefusals);

  /// The head of the line: at most this many events, and at most this many bytes unless the first
  /// event alone is larger.
  [[nodiscard]] std::vector<SpooledEvent> waiting(std::size_t maxEvents, std::size_t maxBytes);
  /// The event, if any, whose last refusal is the longest ago of those that were refused less than
  /// `maxRefusals` times.
  [[nodiscard]] std::vector<SpooledEvent> refused(int maxRefusals);

  /// Removes what was delivered, takes out of the line what was refused, and keeps the state.
  /// Returns whether that is done.
  [[nodiscard]] bool save(const DeliveryOutcome& outcome);

  [[nodiscard]] DurableFile& file() { return file_; }

 private:
  [[nodiscard]] std::vector<SpooledEvent> events(std::string_view which, std::int64_t parameter,
                                                 std::size_t maxBytes);

  const Ports ports_;
  const std::string path_;
  DurableFile file_;
  bool hasSaid_ = false;
};

}  // namespace Tallyhouse
