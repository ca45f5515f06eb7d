// SPDX-License-Identifier: MIT
// The attribute of downloaded files, and records of downloads with any text for a number.
#include <cmath>

#include <Fuzz/Fuzz.h>
#include <Varnel/Platform/Testing/FakeExtendedAttributes.h>
#include <Varnel/Provenance/KVQuarantine.h>

using namespace Varnel;

static void fuzz(std::string_view input) {
  Platform::Testing::FakeExtendedAttributes attributes;
  attributes.values[{"/file", "com.apple.quarantine"}] = std::string(input);
  const auto fields = KVQuarantine::quarantineXATTRsForPath("/file", attributes);
  if (!fields) return;
  std::string joined;
  for (const std::string& field : *fields) joined += ";" + field;
  require(joined.substr(1) == input);

  for (const std::string& field : *fields) {
    const auto entry =
        KVQuarantineEntry::entryWithDictionary({{"LSQuarantineTimeStamp", field},
                                                {"LSQuarantineTypeNumber", field},
                                                {"LSQuarantineDataURLString", field}});
    require(std::isfinite(entry.timestamp()) && entry.dataURLString() == field);
    // An exponent is one to the real number alone.
    if (field.find_first_of("eE") != field.npos) continue;
    const auto whole = static_cast<double>(entry.type());
    require(std::abs(entry.timestamp()) < 1e15 ? std::abs(entry.timestamp() - whole) <= 1
                                               : std::abs(whole) >= 9e14);
  }
}
