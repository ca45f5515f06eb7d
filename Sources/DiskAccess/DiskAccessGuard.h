// SPDX-License-Identifier: MIT
#pragma once

#include <memory>
#include <utility>

#include <Varnel/DiskAccess/DiskAccessingSession.h>

namespace Varnel {

/// Ends a session at the end of a scope, whichever way the scope is left.
///
///     const DiskAccessGuard access(manager.beginAccessingURL(file, "compare"));
///     if (!access) return;  // no access: do not touch the disk
///     read(file);
///
/// To be destroyed on the thread that began the session.
class DiskAccessGuard final {
 public:
  explicit DiskAccessGuard(std::unique_ptr<DiskAccessingSession> session)
      : session_(std::move(session)) {}
  ~DiskAccessGuard() {
    if (session_ && session_->isAccessing()) session_->endAccessing();
  }
  DiskAccessGuard(const DiskAccessGuard&) = delete;
  DiskAccessGuard& operator=(const DiskAccessGuard&) = delete;

  explicit operator bool() const { return session_ != nullptr; }
  [[nodiscard]] DiskAccessingSession* operator->() const { return session_.get(); }

 private:
  const std::unique_ptr<DiskAccessingSession> session_;
};

}  // namespace Varnel
