// SPDX-License-Identifier: MIT
#pragma once

#include <string>

#include <orvane/JSONLine.h>
#include <orvane/TextParts.h>

namespace Orvane {

/// Adds a member with a list to the text of an object, element by element: a list of millions is
/// never whole in memory. `add(index, comma)` adds each with what stands before it. False once
/// something could not be written.
template <typename Add>
bool addJSONList(TextParts& parts, const char* key, std::size_t count, const Add& add) {
  bool isWritten = parts.add(",\"" + std::string(key) + "\":[");
  for (std::size_t i = 0; i < count && isWritten; ++i) isWritten = add(i, i == 0 ? "" : ",");
  return isWritten && parts.add("]");
}

}  // namespace Orvane
