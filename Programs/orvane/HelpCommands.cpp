// SPDX-License-Identifier: MIT
#include <orvane/HelpCommands.h>

#include <orvane/CommandTable.h>
#include <orvane/Console.h>
#include <orvane/HelpText.h>
#include <orvane/ManualPage.h>

namespace Orvane {

int HelpCommand::run(Console& console) const {
  const CommandTable table;
  if (words.empty()) return console.writeResult(helpText(table)) ? 0 : 1;
  std::string name = words.front();
  if (words.size() > 1) name += " " + words[1];
  const std::string text = helpText(table, name);
  if (!text.empty()) return console.writeResult(text) ? 0 : 1;
  console.complain("there is no command \"" + name + "\"");
  return 2;
}

int ManualCommand::run(Console& console) const {
  return console.writeResult(manualPage(CommandTable())) ? 0 : 1;
}

int CompletionCommand::run(Console& console) const {
  return console.writeResult(completionScript(CommandTable(), shell)) ? 0 : 1;
}

}  // namespace Orvane
