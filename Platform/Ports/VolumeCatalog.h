// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/Result.h>
#include <Varnel/Platform/Values/URL.h>

namespace Varnel::Platform {

/// A mounted volume. A fact that the system does not tell is absent.
struct MountedVolume {
  URL url;                              ///< The folder it is mounted on; its path ends with "/".
  std::optional<bool> isLocal = {};     ///< False for network file systems.
  std::optional<bool> isInternal = {};  ///< False for media that the user can take away.
  std::optional<std::string> uuid = {};

  bool operator==(const MountedVolume&) const = default;
};

/// A volume came or went.
struct VolumeChange {
  enum class Kind { mounted, unmounted };
  Kind kind;
  URL volumeURL;
};

/// The mounted volumes and their changes. Any thread. No call touches the volumes themselves: a
/// sleeping disk stays asleep and a dead network share blocks nobody.
class VARNEL_API VolumeCatalog {
 public:
  using ChangeHandler = std::function<void(const VolumeChange&)>;

  /// Ends the subscription when destroyed; afterwards the handler is not running and will not run.
  /// Not to be destroyed inside the handler.
  class Subscription {
   public:
    virtual ~Subscription() = default;
  };

  virtual ~VolumeCatalog() = default;
  VolumeCatalog& operator=(const VolumeCatalog&) = delete;

  /// All mounted volumes in the system's order, without the kernel's own pseudo file systems, and
  /// without those that another one hides, which is mounted over them.
  [[nodiscard]] virtual std::vector<MountedVolume> mountedVolumes() = 0;

  /// The folders that the kernel's own pseudo file systems are mounted on and seen at, written as
  /// volumes are. What is read or opened below them may act, or wait for ever.
  [[nodiscard]] virtual std::vector<URL> pseudoFileSystems() = 0;

  /// The URL of the volume that holds a file or folder. Failed when the path cannot be looked up,
  /// absent when it lies on no volume of the list.
  [[nodiscard]] virtual Result<std::optional<URL>> volumeURL(const URL& url) = 0;

  /// The display name of the volume at this URL: its label, or else its folder's name. Absent when
  /// no such volume is mounted.
  [[nodiscard]] virtual std::optional<std::string> volumeName(const URL& volumeURL) = 0;

  /// Calls the handler after each change, on a thread of the catalogue's choice and never within
  /// one of its calls; by then the lists above already show it. The handler may ask for them. Null
  /// when the system offers no such events.
  [[nodiscard]] virtual std::unique_ptr<Subscription> subscribe(ChangeHandler handler) = 0;
};

}  // namespace Varnel::Platform
