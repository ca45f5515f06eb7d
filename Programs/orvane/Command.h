// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>
#include <functional>
#include <optional>
#include <string>
#include <vector>

namespace Orvane {

class Console;

/// A complaint about a value; none when the value is taken.
using Complaint = std::optional<std::string>;

/// What an option or an operand takes.
struct Value {
  enum class Kind { text, word, file, folder };

  std::string name{};  ///< As help shows it: "BYTES". Empty for the option that takes none.
  Kind kind = Kind::text;
  std::vector<std::string> words{};  ///< Those that may be chosen from, for the kind of that name.
  /// Gets the value, byte for byte as it was given; an empty one from an option that takes none.
  std::function<Complaint(const std::string&)> take{};
};

struct Option {
  char letter = 0;     ///< Its short form, 0 without one.
  std::string name{};  ///< Without the dashes.
  std::string description{};
  Value value{};
  std::string defaultValue{};
  bool isRequired = false;
  bool standsForOperands = false;  ///< With it no operand need be given.
};

/// The arguments of a command that are no options.
struct Operands {
  static constexpr std::size_t anyNumber = static_cast<std::size_t>(-1);

  Value value{};
  std::string description{};
  std::size_t min = 0;
  std::size_t max = 0;
};

/// A member of the JSON object that a command writes; "a[].b" is one of the objects in a list.
struct JSONField {
  std::string key;
  std::string meaning;
};

/// One command, as parser, help, manual page, completion and tests know it. Its options and
/// operands write into the object that `run` runs, so a table serves one parse.
struct Command {
  enum class Group { duplicates, services };

  std::string name{};  ///< Of one word or two.
  Group group = Group::services;
  std::string summary{};
  std::string output{};  ///< What it writes as text.
  std::vector<JSONField> fields{};
  std::vector<Option> options{};
  Operands operands{};
  std::function<int(Console&)> run{};  ///< Returns the exit status.
};

}  // namespace Orvane
