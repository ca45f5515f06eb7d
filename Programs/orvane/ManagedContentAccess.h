// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <functional>
#include <map>
#include <mutex>
#include <optional>
#include <string>

#include <Scan/ContentAccess.h>
#include <Varnel/Platform/Values/QualityOfService.h>
#include <Varnel/Platform/Values/URL.h>

namespace Varnel {
class DiskAccessManager;
}
namespace Varnel::Platform {
class VolumeCatalog;
}

namespace Orvane {

/// Reads as the process's disk access manager admits: a session for each read.
class ManagedContentAccess final : public ContentAccess {
 public:
  struct Ports {
    Varnel::DiskAccessManager& manager;
    Varnel::Platform::VolumeCatalog& volumes;
  };

  ManagedContentAccess(Ports ports, Varnel::Platform::QualityOfService qos);

  bool whileAccessing(const std::string& path, std::uint64_t device,
                      const std::function<void()>& read) override;

 private:
  std::optional<Varnel::Platform::URL> volumeOf(const Varnel::Platform::URL& url,
                                                std::uint64_t device);

  Ports ports_;
  Varnel::Platform::QualityOfService qos_;
  /// Guards the volumes that are known already. Never held while a volume is looked up, as a file
  /// on a dead network share can keep its reader for ever.
  std::mutex mutex_;
  std::map<std::uint64_t, Varnel::Platform::URL> volumesByDevice_;
};

}  // namespace Orvane
