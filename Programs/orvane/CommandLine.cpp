// SPDX-License-Identifier: MIT
#include <orvane/CommandLine.h>

#include <algorithm>
#include <utility>
#include <vector>

#include <Varnel/Context/BuildSwitches.h>
#include <orvane/Arguments.h>
#include <orvane/CommandTable.h>
#include <orvane/HelpText.h>

namespace Orvane {
namespace {

using Parsed = std::variant<Invocation, Information, UsageError>;
using Words = std::vector<std::string>;

/// The command that the first words name, and takes those away; the complaint when there is none.
std::variant<const Command*, UsageError> takeCommand(const CommandTable& table, Words& words) {
  const std::string first = words.front();
  words.erase(words.begin());
  if (!words.empty()) {
    if (const Command* command = table.find(first + " " + words.front())) {
      words.erase(words.begin());
      return command;
    }
  }
  if (const Command* command = table.find(first)) return command;
  const auto subcommands = table.below(first);
  if (subcommands.empty()) return UsageError{"there is no command \"" + first + "\""};
  std::string names;
  for (const Command* command : subcommands)
    names += (names.empty() ? "" : ", ") + command->name.substr(first.size() + 1);
  if (words.empty()) return UsageError{first + " lacks a subcommand: " + names};
  return UsageError{first + " has no subcommand \"" + words.front() + "\", but " + names};
}

std::string versionText() {
  return std::string("orvane ") + QNAppDisplayVersion() + "\n";
}

Invocation invocationOf(const Command& command, const CommandTable::Wishes& wishes) {
  LogOutput output = wishes.verbose ? LogOutput::standardError : LogOutput::none;
  if (wishes.logToStandardOutput) output = LogOutput::standardOutput;
  return {command.run, output};
}

Parsed parse(CommandTable& table, Words words) {
  const auto leading = takeLeadingOptions(table.options, words);
  if (leading.wrong) return UsageError{*leading.wrong};
  const CommandTable::Wishes& wishes = *table.wishes;
  if (wishes.help) return Information{helpText(table)};
  if (wishes.version) return Information{versionText()};
  words.erase(words.begin(), words.begin() + static_cast<std::ptrdiff_t>(leading.count));
  if (words.empty()) return UsageError{leading.count == 0 ? "" : "a command is missing"};

  const std::string first = words.front();
  const bool asksForHelp = words.size() > 1 && (words[1] == "--help" || words[1] == "-h");
  if (asksForHelp && !table.find(first) && !table.below(first).empty())
    return Information{helpText(table, first)};
  const auto found = takeCommand(table, words);
  if (const auto* error = std::get_if<UsageError>(&found)) return *error;
  const Command& command = *std::get<const Command*>(found);
  std::vector<Option> options = command.options;
  options.insert(options.end(), table.options.begin(), table.options.end());
  const auto taken = takeArguments(options, command.operands, std::move(words));
  if (taken.wrong) return UsageError{command.name + ": " + *taken.wrong};
  if (wishes.help) return Information{helpText(table, command.name)};
  if (wishes.version) return Information{versionText()};
  if (taken.missing) return UsageError{command.name + ": " + *taken.missing};
  return invocationOf(command, wishes);
}

}  // namespace

Parsed parseCommandLine(int count, const char* const* arguments) {
  CommandTable table;
  return parse(table, Words(arguments + std::min(count, 1), arguments + count));
}

}  // namespace Orvane
