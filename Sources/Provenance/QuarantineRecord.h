// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <memory>
#include <optional>
#include <string>

#include <Varnel/Provenance/KVQuarantineEntry.h>

namespace Varnel {

/// The members that rows of a database never have.
struct KVQuarantineEntry::Details {
  using OwnText = std::optional<std::string>;

  OwnText agentBundleIdentifier;
  OwnText agentName;
  OwnText senderAddress;
  OwnText originTitle;
  OwnText originURLString;
  std::optional<Platform::PropertyValue> originAlias;
};

/// The content of an entry. The owner of the record owns the texts.
struct KVQuarantineEntry::Record {
  Text eventIdentifier;
  Text dataURLString;
  double timestamp = 0;
  std::int64_t type = 0;
  std::unique_ptr<const Details> details;
};

}  // namespace Varnel
