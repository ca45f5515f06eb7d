// SPDX-License-Identifier: MIT
#include <orvane/CommandGroups.h>

#include <utility>

#include <orvane/CommandParts.h>
#include <orvane/DisksCommand.h>
#include <orvane/ScanAnalytics.h>
#include <orvane/ScanCommand.h>
#include <orvane/ScanReport.h>
#include <orvane/SizeText.h>

namespace Orvane {
namespace {

Complaint checkFolder(const std::string& name) {
  return name.empty() ? Complaint("the name of a folder is empty") : std::nullopt;
}

Complaint checkEndpoint(const std::string& text) {
  if (ScanAnalytics::isEndpoint(text)) return std::nullopt;
  return "\"" + text + "\" is no https URL";
}

Complaint checkGlob(const std::string& pattern) {
  return pattern.empty() ? Complaint("the pattern is empty") : std::nullopt;
}

Value size(const std::shared_ptr<ScanChoice>& choice, std::uint64_t ScanChoice::*member) {
  return {.name = "SIZE", .take = [=](const std::string& given) {
            const Complaint complaint = readSize(given, (*choice).*member);
            if (complaint || choice->minSize <= choice->maxSize) return complaint;
            return Complaint("the smallest size is above the largest");
          }};
}

/// The options that choose what is scanned.
std::vector<Option> choosingOptions(const std::shared_ptr<ScanChoice>& choice) {
  return {
      {.name = "min-size",
       .description = "Leave out smaller files: 4096, 10M or 4KiB, say",
       .value = size(choice, &ScanChoice::minSize)},
      {.name = "max-size",
       .description = "Leave out larger files",
       .value = size(choice, &ScanChoice::maxSize)},
      {.name = "include",
       .description = "Take the files of such a name alone, or of such a path if it has a \"/\"",
       .value = text("GLOB", choice, &ScanChoice::include, Value::Kind::text, checkGlob)},
      {.name = "exclude",
       .description = "Leave out files and folders of such a name, or such a path",
       .value = text("GLOB", choice, &ScanChoice::exclude, Value::Kind::text, checkGlob)},
      {.name = "skip-hidden",
       .description = "Leave out what has a dot in front of its name",
       .value = flag(choice, &ScanChoice::skipsHidden)},
      {.letter = 'x',
       .name = "one-file-system",
       .description = "Enter no file system that is mounted below a folder",
       .value = flag(choice, &ScanChoice::staysOnFileSystem)},
      {.letter = 'k',
       .name = "keep-in",
       .description = "Scan this folder too; its files are to stay",
       .value = text("FOLDER", choice, &ScanChoice::references, Value::Kind::folder, checkFolder)},
      {.name = "files-from",
       .description = "Scan the files that it names, one a line; - is standard input",
       .value = text("FILE", choice, &ScanChoice::listOfFiles, Value::Kind::file),
       .standsForOperands = true},
      {.name = "null",
       .description = "In the list of --files-from, null characters end the names",
       .value = {.take = [choice](const std::string&) {
         choice->endOfNames = NameEnd::null;
         return Complaint();
       }}}};
}

/// The options of a scan that do not choose.
std::vector<Option> workingOptions(const std::shared_ptr<ScanCommand>& command) {
  using enum Varnel::Platform::QualityOfService;
  return {
      {.letter = 'j',
       .name = "json",
       .description = "Print one JSON object, a report for trash and share",
       .value = flag(command, &ScanCommand::form, ScanCommand::Form::json)},
      {.letter = '0',
       .name = "print0",
       .description = "Print the paths alone, a zero byte behind each and one more behind a group",
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
       .value =
           text("URL", command, &ScanCommand::analyticsEndpoint, Value::Kind::text, checkEndpoint)},
      {.name = "print-events",
       .description = "Show events on standard error",
       .value = flag(command, &ScanCommand::printsEvents)}};
}

Command scan() {
  const auto command = std::make_shared<ScanCommand>();
  const std::shared_ptr<ScanChoice> choice = command;
  std::vector<Option> options = workingOptions(command);
  for (Option& option : choosingOptions(choice)) options.push_back(std::move(option));
  return {
      .name = "scan",
      .group = Command::Group::duplicates,
      .summary =
          "Find the files of equal content, as 128-bit digests tell it, in folders and below "
          "them",
      .output =
          "The files of each group, one path a line, the group that wastes most first, or last on "
          "a terminal; folders that hold the same stand for their files; the summary last",
      .fields = scanReportFields(),
      .options = std::move(options),
      .operands = {.value = text("FOLDER", choice, &ScanChoice::folders, Value::Kind::folder,
                                 checkFolder),
                   .description = "The folders; with --files-from none is needed",
                   .min = 1,
                   .max = Operands::anyNumber},
      .run = runs(command)};
}

Command disks() {
  const auto command = std::make_shared<DisksCommand>();
  return {
      .name = "disks",
      .group = Command::Group::duplicates,
      .summary = "List the disks, their kinds, limits and volumes",
      .output =
          "A line a disk, and below it the folders that its volumes are mounted on; live, a "
          "line a process, and below it the disks where it has places or waits for them",
      .fields = {schemaVersionField,
                 {"disks[].uniqueID", "the disk's lasting identifier; null when it has none"},
                 {"disks[].kind", "unknown, solid state, rotational, external or network"},
                 {"disks[].maxReaders", "how many threads may read it at once"},
                 {"disks[].volumes", "file URLs of the folders its volumes are mounted on"},
                 {"processes[].process", "its number; of the live form alone, as what follows"},
                 {"processes[].program", "its name"},
                 {"processes[].disks[].uniqueID", "the identifier, for this process perhaps alone"},
                 {"processes[].disks[].volume", "the path of one of its volumes"},
                 {"processes[].disks[].maxReaders", "how many it admits now"},
                 {"processes[].disks[].places[].propose", "what a place is held for"},
                 {"processes[].disks[].places[].seconds", "for how long"},
                 {"processes[].disks[].waiters",
                  "how many threads wait, from the most to the least urgent class"},
                 {"processes[].disks[].waitersForProcesses",
                  "how many wait for what other processes have"}},
      .options = {{.letter = 'l',
                   .name = "live",
                   .description = "Tell which programs read which disks at this moment",
                   .value = flag(command, &DisksCommand::isLive)},
                  json(command)},
      .run = runs(command)};
}

}  // namespace

std::vector<Command> duplicateCommands() {
  return {scan(), disks()};
}

}  // namespace Orvane
