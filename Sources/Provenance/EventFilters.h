// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

#include <Varnel/Provenance/KVQuarantineEntry.h>

namespace Varnel {

/// Whether an entry of the download database is the wanted one.
using EventFilter = std::function<bool(const KVQuarantineEntry&)>;

/// Passes the entry with exactly this event identifier.
[[nodiscard]] EventFilter eventIdentifierFilter(std::string identifier);

/// Passes an entry whose data URL has the product's name in it: "orvane" in any letter case, any
/// run of dashes, underscores and white space, "2".
[[nodiscard]] EventFilter nameFilter();

/// The newest entry that passes; of several as new, the first.
[[nodiscard]] std::optional<KVQuarantineEntry> filterEvent(
    const std::vector<KVQuarantineEntry>& entries, const EventFilter& filter);

/// The event identifier among the fields of a file's attribute: the fourth.
[[nodiscard]] std::optional<std::string> eventIdentifierIn(
    const std::optional<std::vector<std::string>>& fields);

}  // namespace Varnel
