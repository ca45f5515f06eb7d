// SPDX-License-Identifier: MIT
#include <orvane/DataErasure.h>

#include <chrono>
#include <memory>
#include <thread>

#include <Varnel/Platform/Ports/MainQueue.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Ports/PrivateFiles.h>
#include <Varnel/Platform/Ports/UserNotificationCenter.h>
#include <Varnel/Reminders/UserNotificationRouter.h>
#include <orvane/Reminders.h>
#include <orvane/ScanAnalytics.h>
#include <orvane/StoredRows.h>

namespace Orvane {
namespace {

using Varnel::Platform::FileLock;
using Varnel::Platform::PrivateFiles;
using Varnel::Platform::UserNotificationCenter;

constexpr auto pause = std::chrono::milliseconds(10);
constexpr auto maxWait = std::chrono::seconds(1);

PrivateFiles& privateFiles() {
  return Varnel::Platform::processPorts().privateFiles;
}

/// The locks of a part while it is erased, the last one taken last.
class Locks final {
 public:
  /// Empty once the lock is held, else why not.
  [[nodiscard]] std::string take(const std::string& path) {
    for (const auto end = std::chrono::steady_clock::now() + maxWait;;) {
      auto lock = privateFiles().tryLock(path);
      if (!lock) return lock.error().localizedDescription();
      if (*lock) {
        held_.push_back(std::move(*lock));
        return {};
      }
      if (std::chrono::steady_clock::now() > end) return "another process is at work with it";
      std::this_thread::sleep_for(pause);
    }
  }

 private:
  std::vector<std::unique_ptr<FileLock>> held_;
};

// The order is that of the part: locks, which are held, come last.
void removeFiles(const DataPart& part, Erasure& erasure) {
  for (const DataFile& file : filesOf(part))
    if (const auto reason = removeFile(file)) erasure.left.push_back({file.path, *reason});
}

// Whoever shows their banners takes them away, and forgets what it was to show.
void withdrawReminders() {
  UserNotificationCenter& center = Varnel::UserNotificationRouter::defaultUserNotificationCenter();
  const auto planned = readPatiently(center, &UserNotificationCenter::scheduledNotifications);
  const auto delivered = readPatiently(center, &UserNotificationCenter::deliveredNotifications);
  if (!planned || !delivered) return;
  const auto failure = center.change([&]() -> UserNotificationCenter::Failure {
    for (const auto& each : *planned)
      if (auto error = center.removeScheduledNotification(each)) return error;
    for (const auto& each : *delivered)
      if (auto error = center.removeDeliveredNotification(each)) return error;
    return std::nullopt;
  });
  if (!failure)
    Varnel::Platform::processPorts().mainQueue.get().runWhile([&] { return center.isBusy(); },
                                                              patience());
}

// Before anything is locked: who holds a lock for what is withdrawn frees it then.
[[nodiscard]] std::string withdraw(const DataPart& part) {
  if (part.name == "reminders") withdrawReminders();
  if (part.name == "events" && !ScanAnalytics::discardEvents())
    return "another process has it locked";
  return {};
}

[[nodiscard]] std::string wipe(const DataPart& part) {
  const Wiping wiping = wipeRows(part.path);
  if (wiping.error) return wiping.error->localizedDescription();
  return wiping.isShared ? "another process has it open; what was in it is gone" : "";
}

// Empty when all files may be removed.
[[nodiscard]] std::string prepare(const DataPart& part, Locks& locks) {
  if (part.form == DataPart::Form::logs) return {};
  if (part.form == DataPart::Form::text) return locks.take(part.path + ".lock");
  const bool isThere = privateFiles().identity(part.path).has_value();
  std::string obstacle;
  // Also tells whether all of it is the user's own.
  if (isThere)
    if (const auto path = privateFiles().prepare(part.path); !path)
      obstacle = path.error().localizedDescription();
  if (obstacle.empty() && isThere) obstacle = withdraw(part);
  if (obstacle.empty()) obstacle = locks.take(part.path + part.lock);
  if (obstacle.empty()) obstacle = locks.take(part.path + ".opening");
  if (obstacle.empty() && isThere) obstacle = wipe(part);
  return obstacle;
}

}  // namespace

Erasure erase(const DataPart& part) {
  Erasure erasure;
  if (part.files.empty()) return erasure;
  Locks locks;
  if (const std::string obstacle = prepare(part, locks); obstacle.empty()) {
    removeFiles(part, erasure);
  } else {
    erasure.left.push_back({part.path, obstacle});
  }
  return erasure;
}

}  // namespace Orvane
