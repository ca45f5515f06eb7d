// SPDX-License-Identifier: MIT
#include <orvane/CommandTable.h>

#include <algorithm>
#include <utility>

#include <orvane/CommandGroups.h>
#include <orvane/CommandValues.h>

namespace Orvane {

CommandTable::CommandTable()
    : options{{.letter = 'h',
               .name = "help",
               .description = "Explain the command",
               .value = flag(wishes, &Wishes::help)},
              {.name = "version",
               .description = "Print the version",
               .value = flag(wishes, &Wishes::version)},
              {.letter = 'v',
               .name = "verbose",
               .description = "Print the log on standard error too; its file gets it always",
               .value = flag(wishes, &Wishes::verbose)},
              {.name = "log-to-stdout",
               .description = "Print it on standard output instead",
               .value = flag(wishes, &Wishes::logToStandardOutput)}} {
  for (const auto& group : {duplicateCommands, removalCommands, dataCommands, selfCommands,
                            serviceCommands, reminderCommands})
    for (Command& command : group()) commands.push_back(std::move(command));
}

const Command* CommandTable::find(const std::string& name) const {
  const auto found = std::find_if(commands.begin(), commands.end(),
                                  [&](const Command& command) { return command.name == name; });
  return found == commands.end() ? nullptr : &*found;
}

std::vector<const Command*> CommandTable::below(const std::string& word) const {
  std::vector<const Command*> found;
  for (const Command& command : commands)
    if (command.name.starts_with(word + " ")) found.push_back(&command);
  return found;
}

}  // namespace Orvane
