// SPDX-License-Identifier: MIT
#include <Varnel/Provenance/KVQuarantineEntry.h>

#include <Varnel/Provenance/LenientNumbers.h>
#include <Varnel/Provenance/QuarantineRecord.h>

namespace Varnel {
namespace {

using Platform::PropertyValue;
using OwnText = std::optional<std::string>;

OwnText copied(KVQuarantineEntry::Text text) {
  return text ? OwnText(*text) : std::nullopt;
}

}  // namespace

KVQuarantineEntry::KVQuarantineEntry(Text eventIdentifier, Text agentBundleIdentifier,
                                     Text agentName, double timestamp, Text dataURLString,
                                     Text /*senderName*/, Text senderAddress, std::int64_t type,
                                     Text originTitle, Text originURLString,
                                     std::optional<PropertyValue> originAlias) {
  struct OwningRecord : Record {
    OwnText ownEventIdentifier;
    OwnText ownDataURLString;
  };
  auto record = std::make_shared<OwningRecord>();
  record->ownEventIdentifier = copied(eventIdentifier);
  record->ownDataURLString = copied(dataURLString);
  record->eventIdentifier = record->ownEventIdentifier;
  record->dataURLString = record->ownDataURLString;
  record->timestamp = timestamp;
  record->type = type;
  record->details = std::make_unique<const Details>(
      Details{copied(agentBundleIdentifier), copied(agentName), copied(senderAddress),
              copied(originTitle), copied(originURLString), std::move(originAlias)});
  record_ = std::move(record);
}

KVQuarantineEntry KVQuarantineEntry::entryWithDictionary(
    const Platform::PropertyDictionary& dictionary) {
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
  return record_->details ? *record_->details : none;
}

KVQuarantineEntry::Text KVQuarantineEntry::eventIdentifier() const {
  return record_->eventIdentifier;
}
KVQuarantineEntry::Text KVQuarantineEntry::agentBundleIdentifier() const {
  return details().agentBundleIdentifier;
}
KVQuarantineEntry::Text KVQuarantineEntry::agentName() const {
  return details().agentName;
}
double KVQuarantineEntry::timestamp() const {
  return record_->timestamp;
}
KVQuarantineEntry::Text KVQuarantineEntry::dataURLString() const {
  return record_->dataURLString;
}
KVQuarantineEntry::Text KVQuarantineEntry::senderAddress() const {
  return details().senderAddress;
}
std::int64_t KVQuarantineEntry::type() const {
  return record_->type;
}
KVQuarantineEntry::Text KVQuarantineEntry::originTitle() const {
  return details().originTitle;
}
KVQuarantineEntry::Text KVQuarantineEntry::originURLString() const {
  return details().originURLString;
}
const std::optional<PropertyValue>& KVQuarantineEntry::originAlias() const {
  return details().originAlias;
}

}  // namespace Varnel
