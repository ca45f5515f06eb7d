// SPDX-License-Identifier: MIT
#pragma once

#include <cctype>
#include <charconv>
#include <cstdint>
#include <memory>
#include <string>
#include <type_traits>
#include <utility>
#include <vector>

#include <orvane/Command.h>

namespace Orvane {

// Values that keep themselves in a member of a command.

/// Without a value of its own: the option stands for the meaning.
template <typename Command, typename T = bool>
Value flag(std::shared_ptr<Command> command, T Command::*member,
           std::type_identity_t<T> meaning = true) {
  return {.take = [=](const std::string&) {
    (*command).*member = meaning;
    return Complaint();
  }};
}

/// Any text, or what a check has no complaint about.
template <typename Command, typename Text>
Value text(const std::string& name, std::shared_ptr<Command> command, Text Command::*member,
           Value::Kind kind = Value::Kind::text,
           const std::function<Complaint(const std::string&)>& check = {}) {
  return {.name = name, .kind = kind, .take = [=](const std::string& given) {
            Complaint complaint = check ? check(given) : std::nullopt;
            if constexpr (std::is_same_v<Text, std::vector<std::string>>) {
              ((*command).*member).push_back(given);
            } else {
              (*command).*member = given;
            }
            return complaint;
          }};
}

/// One word of those listed. Words that only scripts of before use are known, but not shown.
template <typename Command, typename T>
Value word(std::string name, std::shared_ptr<Command> command, T Command::*member,
           std::vector<std::pair<std::string, std::type_identity_t<T>>> words,
           std::vector<std::pair<std::string, std::type_identity_t<T>>> formerWords = {}) {
  Value value{.name = name, .kind = Value::Kind::word};
  for (const auto& [each, meaning] : words) value.words.push_back(each);
  words.insert(words.end(), formerWords.begin(), formerWords.end());
  for (char& letter : name) letter = static_cast<char>(std::tolower(letter));
  value.take = [=](const std::string& given) {
    for (const auto& known : words) {
      if (known.first != given) continue;
      (*command).*member = known.second;
      return Complaint();
    }
    return Complaint("there is no " + name + " \"" + given + "\"");
  };
  return value;
}

/// Digits and nothing else: no sign, no other base.
template <typename Command, typename T>
Value wholeNumber(const std::string& name, const std::string& thing,
                  std::shared_ptr<Command> command, T Command::*member) {
  return {.name = name, .take = [=](const std::string& given) {
            const char* const end = given.data() + given.size();
            T& count = (*command).*member;
            const auto [stop, status] = std::from_chars(given.data(), end, count);
            if (status == std::errc::invalid_argument || stop != end || given.starts_with('-'))
              return Complaint("\"" + given + "\" is no " + thing);
            if (status == std::errc::result_out_of_range)
              return Complaint("\"" + given + "\" is more than there can be");
            return Complaint();
          }};
}

template <typename Command>
Value byteCount(std::shared_ptr<Command> command, std::int64_t Command::*member) {
  return wholeNumber("BYTES", "count of bytes", command, member);
}

}  // namespace Orvane
