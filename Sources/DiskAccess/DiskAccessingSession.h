// SPDX-License-Identifier: MIT
#pragma once

#include <memory>
#include <optional>
#include <string>

#include <Varnel/Basalt/ThreadID.h>
#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/Date.h>
#include <Varnel/Platform/Values/QualityOfService.h>
#include <Varnel/Platform/Values/URL.h>

namespace Basalt {
class SecurityScopeBookkeeping;
}

namespace Varnel {

class DiskData;
class DiskRecords;
class OVDiskInfo;

/// Held by a thread while it reads files of one disk; `DiskAccessManager` hands it out.
///
///     if (auto session = DiskAccessManager::shared().beginAccessingURL(file, "compare")) {
///       read(file);
///       session->endAccessing();
///     }
///
/// It belongs to the thread that began it. A thread may hold several, even of one disk, and must
/// end each. Destruction ends nothing: a session that is dropped keeps its place, and its security
/// scope open. `DiskAccessGuard` ends what it holds.
class VARNEL_API DiskAccessingSession final {
 public:
  using SecurityScopes = Basalt::SecurityScopeBookkeeping;

  DiskAccessingSession(Platform::URL url, std::string propose, bool secureScope,
                       std::shared_ptr<DiskData> diskData, Platform::URL volumeURL,
                       std::shared_ptr<DiskRecords> records,
                       std::shared_ptr<SecurityScopes> scopes);
  DiskAccessingSession(const DiskAccessingSession&) = delete;
  DiskAccessingSession& operator=(const DiskAccessingSession&) = delete;

  /// The caller's purpose. (The name is published so.)
  [[nodiscard]] const std::string& propose() const { return propose_; }
  [[nodiscard]] const Platform::URL& url() const { return url_; }

  /// Whether the session opened the security scope of its file and closes it at the end.
  [[nodiscard]] bool secureScope() const { return secureScope_; }
  [[nodiscard]] bool isAccessing() const { return isAccessing_; }

  /// The disk that the access counts against, and its record.
  [[nodiscard]] const std::shared_ptr<const OVDiskInfo>& diskInfo() const;
  [[nodiscard]] const std::shared_ptr<DiskData>& diskData() const { return diskData_; }

  /// Gives the place back and lets waiting threads in. On the thread that began, once.
  void endAccessing();

 private:
  friend class DiskAccessState;
  friend class DiskReadingCore;

  [[nodiscard]] bool beginAccessing(Platform::QualityOfService qos,
                                    std::optional<Platform::TimeInterval> waitingTimeout);
  /// Makes the place, and the session, the calling thread's.
  void passFrom(Basalt::ThreadID thread);
  [[nodiscard]] bool waitForAdmission(Platform::QualityOfService qos,
                                      std::optional<Platform::TimeInterval> waitingTimeout);

  const Platform::URL url_;
  const std::string propose_;
  const bool secureScope_;
  std::shared_ptr<DiskData> diskData_;  ///< Settled once the session is accessing.
  const Platform::URL volumeURL_;
  const std::shared_ptr<DiskRecords> records_;
  const std::shared_ptr<SecurityScopes> scopes_;
  bool isAccessing_ = false;
};

}  // namespace Varnel
