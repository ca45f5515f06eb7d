// SPDX-License-Identifier: MIT
#include <orvane/CommandGroups.h>

#include <orvane/CommandParts.h>
#include <orvane/HelpCommands.h>

namespace Orvane {
namespace {

Command help() {
  const auto command = std::make_shared<HelpCommand>();
  return {.name = "help",
          .group = Command::Group::duplicates,
          .summary = "Explain the program, or a command",
          .output = "The explanation",
          .operands = {.value = text("COMMAND", command, &HelpCommand::words),
                       .description = "The command's name; of one word or two",
                       .max = 2},
          .run = runs(command)};
}

Command manual() {
  return {.name = "manual",
          .group = Command::Group::duplicates,
          .summary = "Print the manual page, as roff for man",
          .output = "The page",
          .run = runs(std::make_shared<ManualCommand>())};
}

Command completion() {
  const auto command = std::make_shared<CompletionCommand>();
  return {.name = "completion",
          .group = Command::Group::duplicates,
          .summary = "Print the script by which a shell completes arguments",
          .output = "The script",
          .operands = {.value = word(
                           "SHELL", command, &CompletionCommand::shell,
                           {{"bash", Shell::bash}, {"zsh", Shell::zsh}, {"fish", Shell::fish}}),
                       .description = "The shell",
                       .min = 1,
                       .max = 1},
          .run = runs(command)};
}

}  // namespace

std::vector<Command> selfCommands() {
  return {help(), manual(), completion()};
}

}  // namespace Orvane
