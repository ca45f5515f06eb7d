// SPDX-License-Identifier: MIT
#include <orvane/Completion.h>

#include <set>

namespace Orvane {
namespace {

std::string joined(const std::vector<std::string>& words) {
  std::string text;
  for (const std::string& word : words) text += (text.empty() ? "" : " ") + word;
  return text;
}

std::string quoted(const std::string& text) {
  std::string shown = "'";
  for (const char letter : text) shown += letter == '\'' ? "'\\''" : std::string(1, letter);
  return shown + "'";
}

/// The words that may come first; of "remind every" the first one.
std::vector<std::string> firstWords(const CommandTable& table) {
  std::vector<std::string> words;
  std::set<std::string> known;
  for (const Command& command : table.commands) {
    const std::string word = command.name.substr(0, command.name.find(' '));
    if (known.insert(word).second) words.push_back(word);
  }
  return words;
}

std::vector<std::string> subcommands(const CommandTable& table, const std::string& word) {
  std::vector<std::string> words;
  for (const Command* command : table.below(word))
    words.push_back(command->name.substr(word.size() + 1));
  return words;
}

std::vector<std::string> formsOf(const std::vector<Option>& options) {
  std::vector<std::string> forms;
  for (const Option& option : options) {
    if (option.letter != 0) forms.push_back(std::string("-") + option.letter);
    forms.push_back("--" + option.name);
  }
  return forms;
}

// --- bash, whose functions zsh runs too

/// What a value may be: the arguments of `compgen`.
std::string bashAction(const Value& value) {
  switch (value.kind) {
    case Value::Kind::word:
      return "-W " + quoted(joined(value.words));
    case Value::Kind::folder:
      return "-d";
    case Value::Kind::file:
      return "-f";
    case Value::Kind::text:
      break;
  }
  return "-W ''";
}

std::string bashCase(const Command& command, const CommandTable& table) {
  std::string text = "    " + quoted(command.name) + ")\n      case \"$before\" in\n";
  std::vector<Option> options = command.options;
  options.insert(options.end(), table.options.begin(), table.options.end());
  for (const Option& option : options) {
    if (option.value.name.empty()) continue;
    text += "        --" + option.name;
    if (option.letter != 0) text += std::string("|-") + option.letter;
    text += ") action=(" + bashAction(option.value) + ") ;;\n";
  }
  return text + "        *)\n          [[ $word == -* ]] && action=(-W " +
         quoted(joined(formsOf(options))) + ") || action=(" +
         (command.operands.max == 0 ? "-W ''" : bashAction(command.operands.value)) +
         ") ;;\n      esac ;;\n";
}

std::string bashScript(const CommandTable& table) {
  std::string text =
      "_orvane() {\n"
      "  local word=${COMP_WORDS[COMP_CWORD]} before=${COMP_WORDS[COMP_CWORD-1]}\n"
      "  local command=${COMP_WORDS[1]} action=(-W '') line\n"
      "  if [ \"$COMP_CWORD\" -eq 1 ]; then\n"
      "    action=(-W " +
      quoted(joined(firstWords(table)) + " " + joined(formsOf(table.options))) + ")\n";
  std::string names;
  for (const std::string& word : firstWords(table)) {
    const auto words = subcommands(table, word);
    if (words.empty()) continue;
    text += "  elif [ \"$COMP_CWORD\" -eq 2 ] && [ \"$command\" = " + word + " ]; then\n" +
            "    action=(-W " + quoted(joined(words)) + ")\n";
    names += (names.empty() ? "" : "|") + word;
  }
  text += "  else\n    case \"$command\" in " + names +
          ") command+=\" ${COMP_WORDS[2]}\" ;; esac\n    case \"$command\" in\n";
  for (const Command& command : table.commands) text += bashCase(command, table);
  return text +
         "    esac\n  fi\n"
         "  COMPREPLY=()\n"
         "  while IFS= read -r line; do COMPREPLY+=(\"$line\"); done < <(compgen \"${action[@]}\" "
         "-- "
         "\"$word\")\n"
         "}\n"
         "complete -o filenames -F _orvane orvane\n";
}

// --- fish

/// When the command line names this command.
std::string fishCondition(const CommandTable& table, const std::string& name) {
  const std::size_t space = name.find(' ');
  std::string text = "__fish_seen_subcommand_from " + name.substr(0, space);
  if (space != std::string::npos) {
    text += "; and __fish_seen_subcommand_from " + name.substr(space + 1);
  } else if (const auto words = subcommands(table, name); !words.empty()) {
    text += "; and not __fish_seen_subcommand_from " + joined(words);
  }
  return quoted(text);
}

std::string fishValue(const Value& value) {
  if (value.name.empty()) return {};
  if (value.kind == Value::Kind::word) return " -x -a " + quoted(joined(value.words));
  return value.kind == Value::Kind::text ? " -x" : " -r -F";
}

std::string fishOption(const Option& option) {
  return (option.letter == 0 ? "" : std::string(" -s ") + option.letter) + " -l " + option.name +
         fishValue(option.value) + " -d " + quoted(option.description) + "\n";
}

std::string fishScript(const CommandTable& table) {
  std::string text = "complete -c orvane -f\n";
  for (const std::string& word : firstWords(table)) {
    const Command* command = table.find(word);
    text += "complete -c orvane -n __fish_use_subcommand -a " + word +
            (command == nullptr ? "" : " -d " + quoted(command->summary)) + "\n";
    for (const Command* below : table.below(word))
      text += "complete -c orvane -n " + fishCondition(table, word) + " -a " +
              below->name.substr(word.size() + 1) + " -d " + quoted(below->summary) + "\n";
  }
  for (const Option& option : table.options) text += "complete -c orvane" + fishOption(option);
  for (const Command& command : table.commands) {
    const std::string start = "complete -c orvane -n " + fishCondition(table, command.name);
    for (const Option& option : command.options) text += start + fishOption(option);
    const Value& value = command.operands.value;
    if (command.operands.max == 0 || value.kind == Value::Kind::text) continue;
    text += start +
            (value.kind == Value::Kind::word ? " -a " + quoted(joined(value.words)) : " -F") + "\n";
  }
  return text;
}

}  // namespace

std::string completionScript(const CommandTable& table, Shell shell) {
  switch (shell) {
    case Shell::bash:
      return bashScript(table);
    case Shell::zsh:
      // The last line completes what the shell loaded the script for.
      return "#compdef orvane\nautoload -U +X bashcompinit && bashcompinit\n" + bashScript(table) +
             "_bash_complete -o filenames -F _orvane\n";
    case Shell::fish:
      break;
  }
  return fishScript(table);
}

}  // namespace Orvane
