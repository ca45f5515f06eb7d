// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>
#include <vector>

namespace Orvane {

/// What a command has found out, one fact after the other.
///
///     FactList facts;
///     facts.add("serialNumber", "serial number", std::nullopt);
///     facts.text(Form::lines);  // "serial number: none\n"
class FactList final {
 public:
  enum class Form {
    lines,  ///< "label: value", one a line; "none" for an absent value.
    json,   ///< One object by keys; null for an absent value.
  };

  void add(std::string key, std::string label, std::optional<std::string> value);

  [[nodiscard]] std::string text(Form form) const;

 private:
  struct Fact {
    std::string key;
    std::string label;
    std::optional<std::string> value;
  };
  std::vector<Fact> facts_;
};

}  // namespace Orvane
