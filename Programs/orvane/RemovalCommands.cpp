// SPDX-License-Identifier: MIT
#include <orvane/CommandGroups.h>

#include <charconv>

#include <orvane/CommandParts.h>
#include <orvane/RestoreCommand.h>
#include <orvane/ShareCommand.h>
#include <orvane/TrashCommand.h>

namespace Orvane {
namespace {

template <typename C>
Operands reportOrFolders(std::shared_ptr<C> command) {
  return {.value = text("REPORT", command, &C::operands, Value::Kind::file),
          .description =
              "What \"orvane scan --json\" has written; \"-\" for standard input. Or else "
              "folders, which are scanned now",
          .min = 1,
          .max = Operands::anyNumber};
}

Command trash() {
  const auto command = std::make_shared<TrashCommand>();
  using enum KeepRule;
  return {
      .name = "trash",
      .group = Command::Group::duplicates,
      .summary =
          "Show, or move to the trash, all files but one of each group of a report; one whose "
          "group has changed since stays",
      .output = "The file that stays of each group, beside those that go; a summary",
      .fields = {schemaVersionField,
                 {"removal", "its number, by which it is restored; null when nothing was begun"},
                 {"moved", "how many files are in the trash now"},
                 {"notAllowed", "how many stay for want of an --allow option"},
                 {"notMoved", "how many stay because of what was met"},
                 {"freedBytes", "what is free once the trash is emptied"},
                 {"groups[].size", "of each file, in bytes"},
                 {"groups[].kept", "the path of the file that stays"},
                 {"groups[].keptURL", "its exact file URL, only where the path is not UTF-8"},
                 {"groups[].tie", "whether the rule has another answer, too"},
                 {"groups[].files[].path", "bytes that are not UTF-8 are U+FFFD"},
                 {"groups[].files[].url", "the exact file URL, only where the path is not UTF-8"},
                 {"groups[].files[].outcome", "\"planned\", \"moved\", or why the file stays"},
                 {"groups[].files[].reason", "what the system has said, only where it did"},
                 {"groups[].files[].otherNames", "how many hard links stay, only where any do"}},
      .options = {json(command),
                  {.letter = 'k',
                   .name = "keep",
                   .description =
                       "Which file of a group stays; of several, the first in the report",
                   .value = word("RULE", command, &TrashCommand::keep,
                                 {{"oldest", oldest},
                                  {"newest", newest},
                                  {"shortest", shortest},
                                  {"first-folder", firstFolder}}),
                   .isRequired = true},
                  {.letter = 'y',
                   .name = "yes",
                   .description = "Move the files; without it they are shown",
                   .value = flag(command, &TrashCommand::moves)},
                  {.name = "allow-hidden",
                   .description = "Move files in hidden folders, too",
                   .value = flag(command, &TrashCommand::allowsHiddenFolders)},
                  {.name = "allow-volumes",
                   .description = "And those on another volume than the file that stays",
                   .value = flag(command, &TrashCommand::allowsOtherFileSystems)},
                  {.name = "allow-packaged",
                   .description = "And those that the package system owns",
                   .value = flag(command, &TrashCommand::allowsPackagedFiles)},
                  {.name = "allow-hard-links",
                   .description =
                       "And all names that the report has of a file with several hard links",
                   .value = flag(command, &TrashCommand::allowsHardLinks)}},
      .operands = reportOrFolders(command),
      .run = runs(command)};
}

Value removalNumber(const std::shared_ptr<RestoreCommand>& command) {
  return {.name = "REMOVAL", .take = [command](const std::string& given) {
            const char* const end = given.data() + given.size();
            std::int64_t number = 0;
            const auto [stop, status] = std::from_chars(given.data(), end, number);
            if (status != std::errc() || stop != end || number <= 0)
              return Complaint("there is no removal \"" + given + "\"");
            command->number = number;
            return Complaint();
          }};
}

Command restore() {
  const auto command = std::make_shared<RestoreCommand>();
  return {.name = "restore",
          .group = Command::Group::duplicates,
          .summary = "Put back what was moved to the trash, and replace nothing",
          .output = "A line a file: its path, and why it is not in place where it is not",
          .options = {{.letter = 'l',
                       .name = "list",
                       .description = "List the removals instead, the last one first",
                       .value = flag(command, &RestoreCommand::lists)}},
          .operands = {.value = removalNumber(command),
                       .description = "A removal's number; that of the last one without it",
                       .max = 1},
          .run = runs(command)};
}

Command share() {
  const auto command = std::make_shared<ShareCommand>();
  return {
      .name = "share",
      .group = Command::Group::duplicates,
      .summary =
          "Keep the content of each group of a report on the disk once, and all its files, where "
          "the file system can; the system compares them",
      .output = "Each file, and what became of it; a summary",
      .fields = {schemaVersionField,
                 {"planned", "how many files can be shared, with --dry-run"},
                 {"shared", "how many take the extents of another file now"},
                 {"sharedBefore", "how many did so before"},
                 {"notShared", "how many stay as they are because of what was met"},
                 {"freedBytes", "what is free now; with --dry-run, what would be"},
                 {"groups[].size", "of each file, in bytes"},
                 {"groups[].files[].path", "bytes that are not UTF-8 are U+FFFD"},
                 {"groups[].files[].url", "the exact file URL, only where the path is not UTF-8"},
                 {"groups[].files[].outcome",
                  "\"source\", \"planned\", \"shared\", \"shared before\", or why it is not"},
                 {"groups[].files[].reason", "what the system has said, only where it did"},
                 {"groups[].files[].freedBytes", "the same of this file"}},
      .options = {json(command),
                  {.letter = 'n',
                   .name = "dry-run",
                   .description = "Ask what could be shared; compare and change nothing",
                   .value = flag(command, &ShareCommand::isTrial)}},
      .operands = reportOrFolders(command),
      .run = runs(command)};
}

}  // namespace

std::vector<Command> removalCommands() {
  return {trash(), restore(), share()};
}

}  // namespace Orvane
