// SPDX-License-Identifier: MIT
#pragma once

#include <memory>
#include <optional>
#include <string_view>

#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Ports/VolumeCatalog.h>
#include <Varnel/Platform/Values/URL.h>

namespace Basalt {
class NotificationCenter;
struct Notification;
}  // namespace Basalt

namespace Varnel {

/// The notifications of mounts and unmounts.
inline constexpr std::string_view didMountNotification = "NSWorkspaceDidMountNotification";
inline constexpr std::string_view didUnmountNotification = "NSWorkspaceDidUnmountNotification";

/// The key of the volume's URL, a text, in the user information of either.
inline constexpr std::string_view volumeURLKey = "NSWorkspaceVolumeURLKey";

/// The volume that such a notification tells of, if it names one.
[[nodiscard]] VARNEL_API std::optional<Platform::URL> volumeURLOf(
    const Basalt::Notification& notification);

/// Posts a notification for each volume that comes or goes, on the catalogue's thread, as long as
/// the relay lives. Both sides must outlive it. The process has one for its default center, which
/// starts with the first `DiskAccessManager()`; others make their own:
///
///     const VolumeChangeRelay relay(volumes, center);
///     DiskAccessManager manager({devices, disks, volumes, securityScope, center});
///
/// Does nothing where the system offers no such events. Not to be destroyed by an observer.
class VARNEL_API VolumeChangeRelay final {
 public:
  VolumeChangeRelay(Platform::VolumeCatalog& volumes, const Basalt::NotificationCenter& center);

 private:
  const std::unique_ptr<Platform::VolumeCatalog::Subscription> subscription_;
};

}  // namespace Varnel
