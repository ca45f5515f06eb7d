// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <utility>

#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/PropertyValue.h>

namespace Varnel {

/// One download as the system recorded it: where the data came from and who fetched it.
///
///     const auto entry = KVQuarantineEntry::entryWithDictionary(record);
///     if (const auto url = entry.dataURLString()) show(*url);
///
/// Immutable; copies share one record. A text lives as long as the entry or any copy of it. Any
/// thread.
class VARNEL_API KVQuarantineEntry final {
 public:
  using Text = std::optional<std::string_view>;

  /// An entry from a record with the keys of the system's table ("LSQuarantineEventIdentifier",
  /// "LSQuarantineTimeStamp", …). A value that should be a text and is not is absent. The time and
  /// the type number are read from texts too, and are 0 when that fails.
  [[nodiscard]] static KVQuarantineEntry entryWithDictionary(
      const Platform::PropertyDictionary& dictionary);

  /// Copies the texts. `senderName` is ignored: the sender's name is the address, as readers have
  /// always seen it.
  KVQuarantineEntry(Text eventIdentifier, Text agentBundleIdentifier, Text agentName,
                    double timestamp, Text dataURLString, Text senderName, Text senderAddress,
                    std::int64_t type, Text originTitle, Text originURLString,
                    std::optional<Platform::PropertyValue> originAlias);

  /// The event's identifier, a UUID by custom; it joins the entry to a file's attribute.
  [[nodiscard]] Text eventIdentifier() const;
  [[nodiscard]] Text agentBundleIdentifier() const;
  [[nodiscard]] Text agentName() const;
  /// The time of the download as it is stored.
  [[nodiscard]] double timestamp() const;
  /// The URL that the data came from.
  [[nodiscard]] Text dataURLString() const;
  /// The sender's address, not the name.
  [[nodiscard]] Text senderName() const { return senderAddress(); }
  [[nodiscard]] Text senderAddress() const;
  [[nodiscard]] std::int64_t type() const;
  /// The title and URL of the page that the download started from.
  [[nodiscard]] Text originTitle() const;
  [[nodiscard]] Text originURLString() const;
  [[nodiscard]] const std::optional<Platform::PropertyValue>& originAlias() const;

 private:
  friend class DownloadList;
  struct Details;
  struct Record;

  explicit KVQuarantineEntry(std::shared_ptr<const Record> record) : record_(std::move(record)) {}
  [[nodiscard]] const Details& details() const;

  std::shared_ptr<const Record> record_;
};

}  // namespace Varnel
