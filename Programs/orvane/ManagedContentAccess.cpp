// SPDX-License-Identifier: MIT
#include <orvane/ManagedContentAccess.h>

#include <climits>

#include <Varnel/DiskAccess/DiskAccessGuard.h>
#include <Varnel/DiskAccess/DiskAccessManager.h>
#include <Varnel/Platform/Ports/VolumeCatalog.h>

namespace Orvane {
namespace {

using Varnel::Platform::URL;

/// The longest part of the path that the system accepts: the path itself or, if that is too long, a
/// folder above.
std::string askablePath(const std::string& path) {
  return path.size() < PATH_MAX ? path : path.substr(0, path.rfind('/', PATH_MAX - 1));
}

}  // namespace

ManagedContentAccess::ManagedContentAccess(Ports ports, Varnel::Platform::QualityOfService qos)
    : ports_(ports), qos_(qos) {}

bool ManagedContentAccess::whileAccessing(const std::string& path, std::uint64_t device,
                                          const std::function<void()>& read) {
  const URL url = URL::fileURLWithPath(askablePath(path));
  // No security scope to open: the user named the folders, and an unreadable file shows when it is
  // opened.
  const Varnel::DiskAccessGuard access(ports_.manager.beginAccessingURL(
      url, "Search for duplicates", qos_, false, std::nullopt, volumeOf(url, device)));
  if (!access) return false;
  read();
  return true;
}

std::optional<URL> ManagedContentAccess::volumeOf(const URL& url, std::uint64_t device) {
  // All volumes of a device number lie on one disk, so the first one found stands for them. This
  // saves a look-up for every file.
  {
    const std::lock_guard lock(mutex_);
    const auto known = volumesByDevice_.find(device);
    if (known != volumesByDevice_.end()) return known->second;
  }
  const auto volume = ports_.volumes.volumeURL(url);
  if (!volume || !*volume) return std::nullopt;
  const std::lock_guard lock(mutex_);
  return volumesByDevice_.emplace(device, **volume).first->second;
}

}  // namespace Orvane
