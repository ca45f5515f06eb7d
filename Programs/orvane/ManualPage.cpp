// SPDX-License-Identifier: MIT
#include <orvane/ManualPage.h>

#include <Varnel/Context/BuildSwitches.h>
#include <orvane/HelpText.h>

namespace Orvane {
namespace {

/// Text that roff shows as it is.
std::string plain(const std::string& text) {
  std::string shown = text.starts_with('.') || text.starts_with('\'') ? "\\&" : "";
  for (const char letter : text) {
    if (letter == '\\') {
      shown += "\\e";
    } else {
      shown += letter == '-' ? "\\-" : std::string(1, letter);
    }
  }
  return shown;
}

std::string bold(const std::string& text) {
  return "\\fB" + plain(text) + "\\fR";
}

std::string section(const std::string& title) {
  return ".SH " + title + "\n";
}

std::string item(const std::string& term, const std::string& explanation) {
  return ".TP\n" + bold(term) + "\n" + plain(explanation) + "\n";
}

std::string itemsOf(const std::vector<Option>& options) {
  std::string text;
  for (const Option& option : options) text += item(formsOf(option), descriptionOf(option));
  return text;
}

std::string textOf(const Command& command) {
  std::string text = ".SS " + plain(command.name) + "\n" + bold(synopsis(command)) + "\n.PP\n" +
                     plain(command.summary) + ".\n";
  if (command.operands.max > 0)
    text += item(command.operands.value.name, descriptionOf(command.operands));
  text += itemsOf(command.options) + ".PP\nPrints: " + plain(command.output) + ".\n";
  if (command.fields.empty()) return text;
  text += ".PP\nWith " + bold("--json") + ", an object on one line:\n";
  for (const JSONField& field : command.fields) text += item(field.key, field.meaning);
  return text;
}

std::string textOf(const CommandTable& table, Command::Group group) {
  std::string text;
  for (const Command& command : table.commands)
    if (command.group == group) text += textOf(command);
  return text;
}

}  // namespace

std::string manualPage(const CommandTable& table) {
  std::string text =
      std::string(".TH ORVANE 1 \"\" \"orvane ") + QNAppDisplayVersion() + "\"\n.nh\n" +
      section("NAME") + "orvane \\- finds duplicate files\n" + section("SYNOPSIS") +
      bold("orvane") + " COMMAND [OPTION...] [ARGUMENT...]\n" + section("DESCRIPTION") +
      "Standard output holds the result alone. The log goes to its file.\n"
      "Behind \"\\-\\-\" everything is an argument.\n" +
      section("DUPLICATES") + textOf(table, Command::Group::duplicates) +
      section("SERVICES OF THE FRAMEWORK") + textOf(table, Command::Group::services) +
      section("OPTIONS OF EVERY COMMAND") + itemsOf(table.options) + section("EXIT STATUS");
  for (const ExitStatus& status : exitStatuses) text += item(status.numbers, status.meaning);
  return text;
}

}  // namespace Orvane
