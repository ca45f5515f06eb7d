// SPDX-License-Identifier: MIT
#pragma once

#include <memory>
#include <string>
#include <vector>

#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/URL.h>

namespace Varnel::Platform {

/// Connects device names with the places they are mounted on. Any thread.
class VARNEL_API DiskArbitration {
 public:
  /// One consistent view of the system's disks, as they were when it was opened. One thread at a
  /// time.
  class Session {
   public:
    virtual ~Session() = default;

    /// The URLs of all places that the device ("sda1") is mounted on, each with a slash at its end;
    /// empty when there are none.
    [[nodiscard]] virtual std::vector<URL> mountURLs(const std::string& deviceName) = 0;
  };

  virtual ~DiskArbitration() = default;
  DiskArbitration& operator=(const DiskArbitration&) = delete;

  /// Null when the service cannot be reached.
  [[nodiscard]] virtual std::unique_ptr<Session> openSession() = 0;
};

}  // namespace Varnel::Platform
