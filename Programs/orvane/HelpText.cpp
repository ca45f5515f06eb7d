// SPDX-License-Identifier: MIT
#include <orvane/HelpText.h>

#include <algorithm>
#include <sstream>
#include <vector>

namespace Orvane {
namespace {

constexpr std::size_t maxColumns = 80;

/// Appends words to the text, which has come to a column, in lines that begin at the indentation.
void wrap(std::string& text, std::size_t column, std::size_t indent, const std::string& words) {
  std::istringstream stream(words);
  bool isFirst = true;
  for (std::string word; stream >> word; isFirst = false) {
    if (!isFirst && column + 1 + word.size() > maxColumns) {
      text += "\n" + std::string(indent, ' ');
      column = indent;
    } else if (!isFirst) {
      text += " ";
      ++column;
    }
    text += word;
    column += word.size();
  }
  text += "\n";
}

struct Line {
  std::string term;
  std::string explanation;
};

std::string listOf(const std::string& title, const std::vector<Line>& lines) {
  if (lines.empty()) return {};
  constexpr std::size_t maxIndent = 26;
  std::size_t indent = 0;
  for (const Line& line : lines) indent = std::max(indent, line.term.size() + 4);
  indent = std::min(indent, maxIndent);
  std::string text = "\n" + title + ":\n";
  for (const Line& line : lines) {
    std::string head = "  " + line.term;
    if (head.size() + 2 > indent) {
      text += head + "\n" + std::string(indent, ' ');
    } else {
      text += head + std::string(indent - head.size(), ' ');
    }
    wrap(text, indent, indent, line.explanation);
  }
  return text;
}

std::string wrapped(const std::string& words, std::size_t indent = 0) {
  std::string text;
  wrap(text, 0, indent, words);
  return text;
}

std::vector<Line> linesOf(const std::vector<Option>& options) {
  std::vector<Line> lines;
  lines.reserve(options.size());
  for (const Option& option : options)
    lines.push_back({(option.letter == 0 ? "    " : "") + formsOf(option), descriptionOf(option)});
  return lines;
}

std::string choiceOf(const std::vector<std::string>& words) {
  std::string text;
  for (std::size_t i = 0; i < words.size(); ++i)
    text += (i == 0 ? "" : i + 1 == words.size() ? " or " : ", ") + words[i];
  return text;
}

std::string helpOf(const Command& command, const CommandTable& table) {
  std::string text =
      wrapped("Usage: " + synopsis(command), 9) + "\n" + wrapped(command.summary + ".");
  if (command.operands.max > 0)
    text += listOf("Arguments", {{command.operands.value.name, descriptionOf(command.operands)}});
  text += listOf("Options", linesOf(command.options));
  text += listOf("Options of every command", linesOf(table.options));
  text += "\n" + wrapped("Prints: " + command.output + ".", 8);
  std::vector<Line> fields;
  for (const JSONField& field : command.fields) fields.push_back({field.key, field.meaning});
  return text + listOf("With --json, an object on one line", fields);
}

}  // namespace

std::string synopsis(const Command& command) {
  std::string text = "orvane " + command.name;
  bool hasOptions = false;
  for (const Option& option : command.options) {
    if (option.isRequired) {
      text += " --" + option.name + " " + option.value.name;
    } else {
      hasOptions = true;
    }
  }
  if (hasOptions) text += " [OPTION...]";
  const Operands& operands = command.operands;
  if (operands.max == 0) return text;
  const std::string name = operands.value.name + (operands.max > 1 ? "..." : "");
  return text + (operands.min == 0 ? " [" + name + "]" : " " + name);
}

std::string formsOf(const Option& option) {
  std::string text = option.letter == 0 ? "" : std::string("-") + option.letter + ", ";
  text += "--" + option.name;
  return option.value.name.empty() ? text : text + " " + option.value.name;
}

std::string descriptionOf(const Option& option) {
  std::string text = option.description;
  if (!option.value.words.empty()) text += ": " + choiceOf(option.value.words);
  return option.defaultValue.empty() ? text : text + " (" + option.defaultValue + " if not given)";
}

std::string descriptionOf(const Operands& operands) {
  if (operands.value.words.empty()) return operands.description;
  return operands.description + ": " + choiceOf(operands.value.words);
}

std::string usageText() {
  return "Usage: orvane scan [OPTION...] FOLDER...   finds the duplicate files in folders\n"
         "       orvane COMMAND [OPTION...] [ARGUMENT...]\n"
         "       orvane --help                       names the commands\n";
}

std::string helpText(const CommandTable& table) {
  const auto linesOfGroup = [&](Command::Group group) {
    std::vector<Line> lines;
    for (const Command& command : table.commands)
      if (command.group == group) lines.push_back({command.name, command.summary});
    return lines;
  };
  std::vector<Line> statuses;
  for (const ExitStatus& status : exitStatuses)
    statuses.push_back({status.numbers, status.meaning});
  return "Usage: orvane COMMAND [OPTION...] [ARGUMENT...]\n\n"
         "Finds duplicate files. \"orvane help COMMAND\" explains a command.\n" +
         listOf("Duplicates", linesOfGroup(Command::Group::duplicates)) +
         listOf("Services of the framework", linesOfGroup(Command::Group::services)) +
         listOf("Options of every command", linesOf(table.options)) +
         listOf("Exit status", statuses);
}

std::string helpText(const CommandTable& table, const std::string& name) {
  if (const Command* command = table.find(name)) return helpOf(*command, table);
  std::string text;
  for (const Command* command : table.below(name))
    text += (text.empty() ? "" : "\n") + helpOf(*command, table);
  return text;
}

}  // namespace Orvane
