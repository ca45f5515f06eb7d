// SPDX-License-Identifier: MIT
#include <Varnel/Provenance/KVQuarantineEntry.h>

#include <string_view>
#include <utility>

#include <Varnel/Provenance/LenientNumbers.h>

namespace Varnel {

using Platform::PropertyDictionary;
using Platform::PropertyValue;

struct KVQuarantineEntry::Details {
  Text agentBundleIdentifier;
  Text agentName;
  Text senderAddress;
  Text originTitle;
  Text originURLString;
  std::optional<PropertyValue> originAlias;

  [[nodiscard]] bool isEmpty() const {
    return !agentBundleIdentifier && !agentName && !senderAddress && !originTitle &&
           !originURLString && !originAlias;
  }
};

KVQuarantineEntry::KVQuarantineEntry(Text eventIdentifier, Text agentBundleIdentifier,
                                     Text agentName, double timestamp, Text dataURLString,
                                     Text /*senderName*/, Text senderAddress, std::int64_t type,
                                     Text originTitle, Text originURLString,
                                     std::optional<PropertyValue> originAlias)
    : eventIdentifier_(std::move(eventIdentifier)),
      dataURLString_(std::move(dataURLString)),
      timestamp_(timestamp),
      type_(type) {
  Details details{std::move(agentBundleIdentifier), std::move(agentName),
                  std::move(senderAddress),         std::move(originTitle),
                  std::move(originURLString),       std::move(originAlias)};
  if (!details.isEmpty()) details_ = std::make_shared<const Details>(std::move(details));
}

KVQuarantineEntry KVQuarantineEntry::entryWithDictionary(const PropertyDictionary& dictionary) {
  const auto text = [&](std::string_view key) -> Text {
    const auto* value = Platform::findAs<std::string>(dictionary, key);
    if (!value) return std::nullopt;
    return *value;
  };
  const PropertyValue* timestamp = find(dictionary, "LSQuarantineTimeStamp");
  const PropertyValue* type = find(dictionary, "LSQuarantineTypeNumber");
  const PropertyValue* originAlias = find(dictionary, "LSQuarantineOriginAlias");
  return KVQuarantineEntry(text("LSQuarantineEventIdentifier"),
                           text("LSQuarantineAgentBundleIdentifier"), text("LSQuarantineAgentName"),
                           timestamp ? lenientReal(*timestamp) : 0.0,
                           text("LSQuarantineDataURLString"), text("LSQuarantineSenderName"),
                           text("LSQuarantineSenderAddress"), type ? lenientInteger(*type) : 0,
                           text("LSQuarantineOriginTitle"), text("LSQuarantineOriginURLString"),
                           originAlias ? std::optional(*originAlias) : std::nullopt);
}

const KVQuarantineEntry::Details& KVQuarantineEntry::details() const {
  static const Details none;
  return details_ ? *details_ : none;
}

const KVQuarantineEntry::Text& KVQuarantineEntry::agentBundleIdentifier() const {
  return details().agentBundleIdentifier;
}
const KVQuarantineEntry::Text& KVQuarantineEntry::agentName() const {
  return details().agentName;
}
const KVQuarantineEntry::Text& KVQuarantineEntry::senderAddress() const {
  return details().senderAddress;
}
const KVQuarantineEntry::Text& KVQuarantineEntry::originTitle() const {
  return details().originTitle;
}
const KVQuarantineEntry::Text& KVQuarantineEntry::originURLString() const {
  return details().originURLString;
}
const std::optional<PropertyValue>& KVQuarantineEntry::originAlias() const {
  return details().originAlias;
}

}  // namespace Varnel
