// SPDX-License-Identifier: MIT
#pragma once

#include <algorithm>
#include <cstdint>
#include <map>
#include <span>
#include <string>
#include <string_view>
#include <system_error>
#include <utility>
#include <vector>

#include <orvane/ShownText.h>

namespace Orvane {

// How the steps of a removal and of a sharing are told: of files by groups, each with its outcome.

struct Wording {
  const char* word;         ///< Behind a path, and in JSON.
  const char* explanation;  ///< Behind a count of files that stay as they are; empty for others.
};

/// The steps of each group, which lie together and have one number in that member.
template <typename Step>
std::vector<std::span<const Step>> groupsOf(const std::vector<Step>& steps,
                                            std::size_t Step::*number) {
  std::vector<std::span<const Step>> groups;
  for (auto begin = steps.begin(), end = begin; begin != steps.end(); begin = end) {
    end = std::find_if(begin, steps.end(),
                       [&](const Step& step) { return step.*number != (*begin).*number; });
    groups.emplace_back(begin, end);
  }
  return groups;
}

/// A line for each explanation: how many files it is for. Of what has failed the system says why.
template <typename Step, typename Outcome>
std::string explanationsOf(const std::vector<Step>& steps, Wording (*wordingOf)(Outcome),
                           const char* staysText, const char* stayText) {
  std::map<std::pair<Outcome, std::error_code>, std::uint64_t> counts;
  for (const Step& step : steps)
    ++counts[{step.outcome, step.outcome == Outcome::failed ? step.code : std::error_code()}];
  std::string text;
  for (const auto& [cause, number] : counts) {
    const auto& [outcome, code] = cause;
    const std::string_view why = wordingOf(outcome).explanation;
    if (why.empty()) continue;
    text += counted(number, staysText, stayText) + ": " + std::string(why);
    text += code ? " (" + code.message() + ")\n" : "\n";
  }
  return text;
}

}  // namespace Orvane
