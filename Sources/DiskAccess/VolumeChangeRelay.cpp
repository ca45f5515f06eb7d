// SPDX-License-Identifier: MIT
#include <Varnel/DiskAccess/VolumeChangeRelay.h>

#include <string>

#include <Varnel/Basalt/NotificationCenter.h>

namespace Varnel {
namespace {

Basalt::Notification notificationOf(const Platform::VolumeChange& change) {
  const bool isMount = change.kind == Platform::VolumeChange::Kind::mounted;
  return {.name = std::string(isMount ? didMountNotification : didUnmountNotification),
          .userInfo = {{std::string(volumeURLKey), change.volumeURL.absoluteString()}}};
}

}  // namespace

std::optional<Platform::URL> volumeURLOf(const Basalt::Notification& notification) {
  const auto* text = Platform::findAs<std::string>(notification.userInfo, volumeURLKey);
  return text ? Platform::URL::parse(*text) : std::nullopt;
}

VolumeChangeRelay::VolumeChangeRelay(Platform::VolumeCatalog& volumes,
                                     const Basalt::NotificationCenter& center)
    : subscription_(volumes.subscribe([&center](const Platform::VolumeChange& change) {
        center.post(notificationOf(change));
      })) {}

}  // namespace Varnel
