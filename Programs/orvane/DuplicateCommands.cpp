// SPDX-License-Identifier: MIT
#include <orvane/CommandGroups.h>

#include <orvane/CommandParts.h>
#include <orvane/DisksCommand.h>
#include <orvane/ScanAnalytics.h>
#include <orvane/ScanCommand.h>
#include <orvane/ScanReport.h>

namespace Orvane {
namespace {

using Varnel::Platform::QualityOfService;

Complaint checkFolder(const std::string& name) {
  return name.empty() ? Complaint("the name of a folder is empty") : std::nullopt;
}

Complaint checkEndpoint(const std::string& text) {
  if (ScanAnalytics::isEndpoint(text)) return std::nullopt;
  return "\"" + text + "\" is no https URL";
}

Command scan() {
  const auto command = std::make_shared<ScanCommand>();
  using enum QualityOfService;
  return {
      .name = "scan",
      .group = Command::Group::duplicates,
      .summary =
          "Find the files of equal content, as 128-bit digests tell it, in folders and below "
          "them",
      .output =
          "The files of each group, one path a line, the group that wastes most first, or last on "
          "a "
          "terminal; folders that hold the same stand for their files; the summary last",
      .fields = scanReportFields(),
      .options = {{.letter = 'j',
                   .name = "json",
                   .description = "Print one JSON object, a report for trash and share",
                   .value = flag(command, &ScanCommand::form, ScanCommand::Form::json)},
                  {.letter = '0',
                   .name = "print0",
                   .description =
                       "Print the paths alone, a zero byte behind each and one more behind a group",
                   .value = flag(command, &ScanCommand::form, ScanCommand::Form::pathList)},
                  {.letter = 't',
                   .name = "top",
                   .description = "Print no more groups than these, those that waste most",
                   .value = wholeNumber("NUMBER", "number", command, &ScanCommand::maxGroups)},
                  {.letter = 's',
                   .name = "summary",
                   .description = "Print the summary, or the totals, without any group",
                   .value = flag(command, &ScanCommand::maxGroups, 0)},
                  {.name = "no-progress",
                   .description = "Do not show on the terminal how far the scan is",
                   .value = flag(command, &ScanCommand::showsProgress, false)},
                  {.letter = 'p',
                   .name = "progress",
                   .description = "Show it, as without either",
                   .value = flag(command, &ScanCommand::showsProgress)},
                  {.name = "sound",
                   .description = "Play a sound at the end",
                   .value = flag(command, &ScanCommand::playsSound)},
                  {.letter = 'q',
                   .name = "qos",
                   .description = "How urgent reading is",
                   .value = word("QUALITY", command, &ScanCommand::qos,
                                 {{"background", background},
                                  {"utility", utility},
                                  {"user-initiated", userInitiated},
                                  {"user-interactive", userInteractive}}),
                   .defaultValue = "utility"},
                  {.name = "analytics",
                   .description = "Send events of the scan there, if the user consents",
                   .value = text("URL", command, &ScanCommand::analyticsEndpoint, Value::Kind::text,
                                 checkEndpoint)},
                  {.name = "print-events",
                   .description = "Show events on standard error",
                   .value = flag(command, &ScanCommand::printsEvents)}},
      .operands = {.value = text("FOLDER", command, &ScanCommand::folders, Value::Kind::folder,
                                 checkFolder),
                   .description = "The folders",
                   .min = 1,
                   .max = Operands::anyNumber},
      .run = runs(command)};
}

Command disks() {
  const auto command = std::make_shared<DisksCommand>();
  return {.name = "disks",
          .group = Command::Group::duplicates,
          .summary = "List the disks, their kinds, limits and volumes",
          .output = "A line a disk, and below it the folders that its volumes are mounted on",
          .fields = {schemaVersionField,
                     {"disks[].uniqueID", "the disk's lasting identifier; null when it has none"},
                     {"disks[].kind", "unknown, solid state, rotational, external or network"},
                     {"disks[].maxReaders", "how many threads may read it at once"},
                     {"disks[].volumes", "file URLs of the folders its volumes are mounted on"}},
          .options = {json(command)},
          .run = runs(command)};
}

}  // namespace

std::vector<Command> duplicateCommands() {
  return {scan(), disks()};
}

}  // namespace Orvane
