// SPDX-License-Identifier: MIT
#pragma once

#include <memory>
#include <optional>
#include <string>

#include <Varnel/DiskAccess/DiskAccessingSession.h>
#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/Date.h>
#include <Varnel/Platform/Values/URL.h>

namespace Varnel {

/// Begins access to a file through the process's `DiskAccessManager`, with the quality of service
/// of a utility. Null when there is no access; see `DiskAccessManager::beginAccessingURL`.
/// The first use throws as `DiskAccessManager::shared()` does.
///
///     if (auto session = beginManagedAccessing(file, "preview")) {
///       read(file);
///       session->endAccessing();
///     }
[[nodiscard]] VARNEL_API std::unique_ptr<DiskAccessingSession> beginManagedAccessing(
    const Platform::URL& url, std::string propose = "", bool enableSecureScopedAccess = true,
    std::optional<Platform::TimeInterval> accessWaitingTimeout = {},
    const std::optional<Platform::URL>& volumeURL = {});

}  // namespace Varnel
