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

VolumeChangeRelay::VolumeChangeRelay(Platform::VolumeCatalog& volumes,
                                     const Basalt::NotificationCenter& center)
    : subscription_(volumes.subscribe([&center](const Platform::VolumeChange& change) {
        center.post(notificationOf(change));
      })) {}

}  // namespace Varnel
