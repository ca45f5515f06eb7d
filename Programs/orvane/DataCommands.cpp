// SPDX-License-Identifier: MIT
#include <orvane/CommandGroups.h>

#include <orvane/CommandParts.h>
#include <orvane/DataCommand.h>

namespace Orvane {
namespace {

Command show() {
  const auto command = std::make_shared<DataShowCommand>();
  return {.name = "data show",
          .group = Command::Group::duplicates,
          .summary = "Tell what is kept about this user and machine, and where",
          .output = "A line a kind: entries, size, place",
          .fields = {schemaVersionField,
                     {"product", "the identifier that the folders are named by"},
                     {"clientIdentifier", "what events carry; null when there is none"},
                     {"parts[].name", "settings, events, removals, reminders or logs"},
                     {"parts[].path", "the file, or the logs' folder; it need not be there"},
                     {"parts[].bytes", "of all its files"},
                     {"parts[].entries", "how many it holds; null where that is not known"},
                     {"parts[].files", "the paths of all that are there, locks included"}},
          .options = {json(command)},
          .run = runs(command)};
}

Command exportAll() {
  return {.name = "data export",
          .group = Command::Group::duplicates,
          .summary = "Print all that is kept, with what is in it",
          .output = "One JSON object on one line: a list of files a kind, with text or tables",
          .run = runs(std::make_shared<DataExportCommand>())};
}

Command erase() {
  const auto command = std::make_shared<DataEraseCommand>();
  return {.name = "data erase",
          .group = Command::Group::duplicates,
          .summary = "Show, or remove, all that is kept; files in the trash stay there",
          .output = "A line a kind: what is gone, or is left and why",
          .options = {{.letter = 'y',
                       .name = "yes",
                       .description = "Remove it; without it it is shown",
                       .value = flag(command, &DataEraseCommand::erases)}},
          .run = runs(command)};
}

}  // namespace

std::vector<Command> dataCommands() {
  return {show(), exportAll(), erase()};
}

}  // namespace Orvane
