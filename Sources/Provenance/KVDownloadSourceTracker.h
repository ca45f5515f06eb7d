// SPDX-License-Identifier: MIT
#pragma once

#include <memory>
#include <optional>
#include <string>
#include <vector>

#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/Date.h>
#include <Varnel/Provenance/KVQuarantine.h>

namespace Basalt {
class Executor;
}

namespace Varnel::Platform {
class ProcessInfo;
class ProcessLauncher;
class UserDefaults;
class VolumeCatalog;
struct Ports;
}  // namespace Varnel::Platform

namespace Varnel {

/// Finds the download that the running application came from.
///
///     auto tracker = KVDownloadSourceTracker::sharedTracker();
///     tracker->privateQueue()->execute([tracker] {
///       if (const auto entry = tracker->installSourceEntry()) remember(entry->dataURLString());
///     });
///
/// The attribute of the disk image names the download, if the copy runs from a mounted one; else
/// the attribute of the application itself. If neither names one, the first download with the
/// product's name in its URL is taken.
///
/// `installSourceEntry()` may be called from any thread; the properties are to be set before.
class VARNEL_API KVDownloadSourceTracker final {
 public:
  /// The services that the tracker asks; they outlive it.
  struct VARNEL_API Ports {
    Platform::ExtendedAttributes& extendedAttributes;
    Platform::ProcessInfo& processInfo;
    Platform::ProcessLauncher& processLauncher;
    Platform::SystemLog& systemLog;
    Platform::UserDefaults& userDefaults;
    Platform::VolumeCatalog& volumeCatalog;

    /// Those of a set, with the application's settings.
    [[nodiscard]] static Ports of(const Platform::Ports& ports);
  };

  /// Where things are on the machine.
  struct Places {
    std::string diskImageTool = "/usr/bin/hdiutil";
    std::string volumesRoot = "/Volumes";
    std::optional<std::string> bundlePath = {};  ///< The running application's when absent.
    /// The tool is ended after this time. Absent: never.
    std::optional<Platform::TimeInterval> toolTimeout = {};
  };

  explicit KVDownloadSourceTracker(std::shared_ptr<KVQuarantine> quarantine);
  KVDownloadSourceTracker(std::shared_ptr<KVQuarantine> quarantine, Places places);
  KVDownloadSourceTracker(std::shared_ptr<KVQuarantine> quarantine, Places places, Ports ports);
  ~KVDownloadSourceTracker();
  KVDownloadSourceTracker(const KVDownloadSourceTracker&) = delete;
  KVDownloadSourceTracker& operator=(const KVDownloadSourceTracker&) = delete;

  /// The process's own, over this user's current database.
  [[nodiscard]] static std::shared_ptr<KVDownloadSourceTracker> sharedTracker();
  [[nodiscard]] static std::shared_ptr<KVDownloadSourceTracker> trackerWithQuarantine(
      std::shared_ptr<KVQuarantine> quarantine);

  /// The download of the running application, absent when it is not known. Blocks while the
  /// disk-image tool runs and the database is read: keep it off the main thread. Does all the work
  /// anew each time.
  [[nodiscard]] std::optional<KVQuarantineEntry> installSourceEntry() const;

  /// The database that is searched; without one nothing is found.
  [[nodiscard]] const std::shared_ptr<KVQuarantine>& quarantine() const { return quarantine_; }
  void setQuarantine(std::shared_ptr<KVQuarantine> quarantine);

  /// Held for clients; the tracker reads and writes no setting.
  [[nodiscard]] const std::shared_ptr<Platform::UserDefaults>& userDefaults() const;
  void setUserDefaults(std::shared_ptr<Platform::UserDefaults> userDefaults);

  /// Held for clients; the tracker works on the caller's thread.
  [[nodiscard]] const std::shared_ptr<Basalt::Executor>& privateQueue() const;
  void setPrivateQueue(std::shared_ptr<Basalt::Executor> queue);

 private:
  [[nodiscard]] std::string bundlePath() const;
  [[nodiscard]] std::optional<std::string> volumeName(const std::string& bundlePath) const;
  [[nodiscard]] std::optional<std::string> identifierOfImage(const std::string& bundlePath) const;
  [[nodiscard]] std::optional<std::string> identifierOfFile(const std::string& path) const;

  const Ports ports_;
  const Places places_;
  std::shared_ptr<KVQuarantine> quarantine_;
  std::shared_ptr<Platform::UserDefaults> userDefaults_;
  std::shared_ptr<Basalt::Executor> privateQueue_;
};

}  // namespace Varnel
