// SPDX-License-Identifier: MIT
#include <Varnel/Identification/Analytics/AnalyticsEcho.h>

#include <fmt/format.h>

#include <Varnel/Platform/Text/VisibleText.h>

namespace Varnel {
namespace {

// Written as a literal in source code, so that an entry stays on one line and the ends of a text
// show.
std::string literal(std::string_view text) {
  std::string out = "\"";
  for (const char c : text) {
    switch (c) {
      case '"':
        out += "\\\"";
        break;
      case '\\':
        out += "\\\\";
        break;
      case '\n':
        out += "\\n";
        break;
      case '\r':
        out += "\\r";
        break;
      case '\t':
        out += "\\t";
        break;
      case '\0':
        out += "\\0";
        break;
      default:
        out += c;
    }
  }
  return out += '"';
}

std::string listText(const Tallyhouse::CustomDimensions& dimensions) {
  std::string text = "[";
  for (const auto& dimension : dimensions) {
    if (text.size() > 1) text += ", ";
    text += dimension ? "Optional(" + literal(*dimension) + ")" : "nil";
  }
  // Campaigns and cookies hold what others wrote, which must not control the terminal.
  return Platform::visibleText(text += ']', Platform::Backslashes::kept);
}

}  // namespace

std::string analyticsEcho(std::string_view category, std::string_view action,
                          const std::optional<std::string>& label,
                          std::optional<std::int64_t> value,
                          const Tallyhouse::CustomDimensions& customDimensions) {
  return fmt::format("Category: `{}` Action: `{}` Label: `{}` Value: `{}` CustomDimensions: {}",
                     category, action, label.value_or("nil"),
                     value ? std::to_string(*value) : "nil", listText(customDimensions));
}

}  // namespace Varnel
