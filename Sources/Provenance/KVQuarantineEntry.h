// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <memory>
#include <optional>
#include <string>

#include <Platform/Api.h>
#include <Platform/Values/PropertyValue.h>

namespace Varnel {

/// One download as the system recorded it: where the data came from and who fetched it.
///
///     const auto entry = KVQuarantineEntry::entryWithDictionary(record);
///     if (entry.dataURLString()) show(*entry.dataURLString());
///
/// Immutable; copies share what they can. Any thread.
class VARNEL_API KVQuarantineEntry final {
 public:
  using Text = std::optional<std::string>;

  /// An entry from a record with the keys of the system's table ("LSQuarantineEventIdentifier",
  /// "LSQuarantineTimeStamp", …). A text that is none is absent; the time and the type number also
  /// read from texts, and are 0 when nothing can be read.
  [[nodiscard]] static KVQuarantineEntry entryWithDictionary(
      const Platform::PropertyDictionary& dictionary);

  /// `senderName` is ignored: the sender's name is the address, as readers have always seen it.
  KVQuarantineEntry(Text eventIdentifier, Text agentBundleIdentifier, Text agentName,
                    double timestamp, Text dataURLString, Text senderName, Text senderAddress,
                    std::int64_t type, Text originTitle, Text originURLString,
                    std::optional<Platform::PropertyValue> originAlias);

  /// The event's identifier, a UUID by custom; it joins the entry to a file's attribute.
  [[nodiscard]] const Text& eventIdentifier() const { return eventIdentifier_; }
  [[nodiscard]] const Text& agentBundleIdentifier() const;
  [[nodiscard]] const Text& agentName() const;
  /// The time of the download as it is stored.
  [[nodiscard]] double timestamp() const { return timestamp_; }
  /// The URL that the data came from.
  [[nodiscard]] const Text& dataURLString() const { return dataURLString_; }
  /// The sender's address, not the name.
  [[nodiscard]] const Text& senderName() const { return senderAddress(); }
  [[nodiscard]] const Text& senderAddress() const;
  [[nodiscard]] std::int64_t type() const { return type_; }
  /// The title and URL of the page that the download started from.
  [[nodiscard]] const Text& originTitle() const;
  [[nodiscard]] const Text& originURLString() const;
  [[nodiscard]] const std::optional<Platform::PropertyValue>& originAlias() const;

 private:
  struct Details;
  [[nodiscard]] const Details& details() const;

  // The rows of a database have an identifier and a URL and nothing else: a hundred thousand of
  // them need not carry seven absences each.
  Text eventIdentifier_;
  Text dataURLString_;
  double timestamp_;
  std::int64_t type_;
  std::shared_ptr<const Details> details_;
};

}  // namespace Varnel
