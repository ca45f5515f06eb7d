// SPDX-License-Identifier: MIT
#include <Varnel/Provenance/KVDownloadSourceTracker.h>

#include <system_error>
#include <utility>

#include <Varnel/Basalt/Executor.h>
#include <Varnel/Context/Globals.h>
#include <Varnel/Platform/Ports/ApplicationStorage.h>
#include <Varnel/Platform/Ports/ExtendedAttributes.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Ports/ProcessInfo.h>
#include <Varnel/Platform/Ports/ProcessLauncher.h>
#include <Varnel/Platform/Ports/SystemLog.h>
#include <Varnel/Platform/Ports/UserDefaults.h>
#include <Varnel/Platform/Ports/VolumeCatalog.h>
#include <Varnel/Provenance/DiskImages.h>
#include <Varnel/Provenance/EventFilters.h>

namespace Varnel {
namespace {

using Platform::PlatformError;
using Platform::URL;

// The process's ports are never destroyed.
std::shared_ptr<Platform::UserDefaults> unowned(Platform::UserDefaults& userDefaults) {
  return {std::shared_ptr<void>(), &userDefaults};
}

Platform::Result<std::string> nameOfVolume(const URL& url, Platform::VolumeCatalog& volumes) {
  auto volume = volumes.volumeURL(url);
  if (!volume) return volume.error();
  auto name = *volume ? volumes.volumeName(**volume) : std::nullopt;
  if (!name) return PlatformError(std::make_error_code(std::errc::no_such_device));
  return std::move(*name);
}

}  // namespace

KVDownloadSourceTracker::Ports KVDownloadSourceTracker::Ports::of(const Platform::Ports& ports) {
  return {.extendedAttributes = ports.extendedAttributes,
          .processInfo = ports.processInfo,
          .processLauncher = ports.processLauncher,
          .systemLog = ports.systemLog,
          .userDefaults = ports.applicationStorage.get().userDefaults(Globals::baseIdentifier()),
          .volumeCatalog = ports.volumeCatalog};
}

KVDownloadSourceTracker::KVDownloadSourceTracker(std::shared_ptr<KVQuarantine> quarantine,
                                                 Places places, Ports ports)
    : ports_(ports),
      places_(std::move(places)),
      quarantine_(std::move(quarantine)),
      userDefaults_(unowned(ports.userDefaults)),
      privateQueue_(Basalt::globalConcurrentQueue()) {}

KVDownloadSourceTracker::KVDownloadSourceTracker(std::shared_ptr<KVQuarantine> quarantine,
                                                 Places places)
    : KVDownloadSourceTracker(std::move(quarantine), std::move(places),
                              Ports::of(Platform::processPorts())) {}

KVDownloadSourceTracker::KVDownloadSourceTracker(std::shared_ptr<KVQuarantine> quarantine)
    : KVDownloadSourceTracker(std::move(quarantine), Places()) {}

KVDownloadSourceTracker::~KVDownloadSourceTracker() = default;

std::shared_ptr<KVDownloadSourceTracker> KVDownloadSourceTracker::sharedTracker() {
  static const auto& shared = *new std::shared_ptr<KVDownloadSourceTracker>(
      trackerWithQuarantine(KVQuarantine::systemQuarantine()));
  return shared;
}

std::shared_ptr<KVDownloadSourceTracker> KVDownloadSourceTracker::trackerWithQuarantine(
    std::shared_ptr<KVQuarantine> quarantine) {
  return std::make_shared<KVDownloadSourceTracker>(std::move(quarantine));
}

std::optional<KVQuarantineEntry> KVDownloadSourceTracker::installSourceEntry() const {
  const std::string bundle = bundlePath();
  // A test of the text, not of path components: "/VolumesX" counts as well.
  auto identifier =
      bundle.starts_with(places_.volumesRoot) ? identifierOfImage(bundle) : std::nullopt;
  if (!identifier) identifier = identifierOfFile(bundle);

  if (!quarantine_) return std::nullopt;
  const auto entries = quarantine_->entries();
  if (entries.empty()) return std::nullopt;
  if (identifier)
    if (auto entry = filterEvent(entries, eventIdentifierFilter(*identifier))) return entry;
  return filterEvent(entries, nameFilter());
}

// An application without a bundle is its executable.
std::string KVDownloadSourceTracker::bundlePath() const {
  if (places_.bundlePath) return *places_.bundlePath;
  if (auto folder = ports_.processInfo.mainBundleFolder()) return *folder;
  return ports_.processInfo.executablePath();
}

std::optional<std::string> KVDownloadSourceTracker::volumeName(
    const std::string& bundlePath) const {
  auto name = nameOfVolume(URL::fileURLWithPath(bundlePath), ports_.volumeCatalog);
  if (name) return std::move(*name);
  ports_.systemLog.write("Cannot obtain volume name: " + name.error().description());
  return std::nullopt;
}

std::optional<std::string> KVDownloadSourceTracker::identifierOfImage(
    const std::string& bundlePath) const {
  const auto name = volumeName(bundlePath);
  if (!name) return std::nullopt;
  const auto info =
      mountedDrivesInfo(ports_.processLauncher, places_.diskImageTool, places_.toolTimeout);
  if (!info) return std::nullopt;
  const auto image = findImagePath(places_.volumesRoot + '/' + *name, *info);
  if (!image) return std::nullopt;
  return identifierOfFile(*image);
}

std::optional<std::string> KVDownloadSourceTracker::identifierOfFile(
    const std::string& path) const {
  return eventIdentifierIn(KVQuarantine::quarantineXATTRsForPath(path, ports_.extendedAttributes));
}

void KVDownloadSourceTracker::setQuarantine(std::shared_ptr<KVQuarantine> quarantine) {
  quarantine_ = std::move(quarantine);
}

const std::shared_ptr<Platform::UserDefaults>& KVDownloadSourceTracker::userDefaults() const {
  return userDefaults_;
}
void KVDownloadSourceTracker::setUserDefaults(std::shared_ptr<Platform::UserDefaults> defaults) {
  userDefaults_ = std::move(defaults);
}

const std::shared_ptr<Basalt::Executor>& KVDownloadSourceTracker::privateQueue() const {
  return privateQueue_;
}
void KVDownloadSourceTracker::setPrivateQueue(std::shared_ptr<Basalt::Executor> queue) {
  privateQueue_ = std::move(queue);
}

}  // namespace Varnel
