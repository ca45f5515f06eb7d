// SPDX-License-Identifier: MIT
#include <orvane/CommandTable.h>

#include <algorithm>
#include <cctype>

#include <orvane/AnalyticsCommand.h>
#include <orvane/CommandValues.h>
#include <orvane/DisksCommand.h>
#include <orvane/HelpCommands.h>
#include <orvane/IdentifyCommand.h>
#include <orvane/LinkCommand.h>
#include <orvane/MenuCommand.h>
#include <orvane/OriginCommand.h>
#include <orvane/PathCommand.h>
#include <orvane/RemindCommands.h>
#include <orvane/ScanAnalytics.h>
#include <orvane/ScanCommand.h>
#include <orvane/SoundCommand.h>

namespace Orvane {
namespace {

using Varnel::Platform::QualityOfService;

/// What runs the command that the options have filled in.
template <typename C>
std::function<int(Console&)> runs(std::shared_ptr<C> command) {
  return [command](Console& console) { return command->run(console); };
}

template <typename C>
Option json(std::shared_ptr<C> command) {
  return {.letter = 'j',
          .name = "json",
          .description = "Print one JSON object",
          .value = flag(command, &C::isJSON)};
}

const JSONField schemaVersion = {"schemaVersion",
                                 "1; another number where a field has changed its meaning"};

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
          "The files of each group, one path a line, the group that wastes most first; the "
          "summary last",
      .fields = {schemaVersion,
                 {"folders", "how many were read"},
                 {"files", "how many were found"},
                 {"bytes", "of all files, hard links once"},
                 {"emptyFiles", "files without content, which are no duplicates"},
                 {"hardLinks", "further names of files already counted"},
                 {"unreadableFiles", "files that could not be read"},
                 {"vanishedFiles", "files that were gone when their turn came"},
                 {"changedFiles", "files that changed meanwhile"},
                 {"unreadableFolders", "folders that could not be read, or only in part"},
                 {"duplicateFiles", "files that could go: all but one of each group"},
                 {"wastedBytes", "what those take up"},
                 {"groups[].size", "of each file, in bytes"},
                 {"groups[].paths",
                  "of the files, in the order of their bytes; bytes that are not "
                  "UTF-8 are U+FFFD"},
                 {"groups[].urls", "exact file URLs of all paths, only where a path is not UTF-8"}},
      .options = {json(command),
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
          .fields = {schemaVersion,
                     {"disks[].uniqueID", "the disk's lasting identifier; null when it has none"},
                     {"disks[].kind", "unknown, solid state, rotational, external or network"},
                     {"disks[].maxReaders", "how many threads may read it at once"},
                     {"disks[].volumes", "file URLs of the folders its volumes are mounted on"}},
          .options = {json(command)},
          .run = runs(command)};
}

Command analytics() {
  return {.name = "analytics",
          .summary = "Tell whether events of the scans may be sent",
          .output = "The answer, and how many events wait",
          .run = runs(std::make_shared<AnalyticsCommand>())};
}

Command consent() {
  const auto command = std::make_shared<AnalyticsCommand>();
  using enum Tallyhouse::Consent;
  return {.name = "analytics consent",
          .summary = "Tell it, or answer the question",
          .output = "The answer, and how many events wait",
          .operands = {.value = word("ANSWER", command, &AnalyticsCommand::answer,
                                     {{"yes", granted}, {"no", refused}}),
                       .description = "no also throws away what has not been sent",
                       .max = 1},
          .run = runs(command)};
}

Command identify() {
  const auto command = std::make_shared<IdentifyCommand>();
  return {.name = "identify",
          .summary = "Print what this installation is recognised by",
          .output = "A fact a line, \"none\" where there is none",
          .fields = {schemaVersion,
                     {"machineUUID", "the machine's; null when it has none, as all that follow"},
                     {"serialNumber", "the machine's"},
                     {"userIdentifier", "a digest of 64 digits"},
                     {"primaryMacAddress", "of the first network interface"},
                     {"downloadSourceURL", "where the program was downloaded from"},
                     {"downloadSourceURLCid", "the campaign of the download"},
                     {"GACookieValue", "the client of the web analytics"},
                     {"uniqueClientIdentifier", "the one that links carry"}},
          .options = {json(command)},
          .run = runs(command)};
}

Command link() {
  const auto command = std::make_shared<LinkCommand>();
  return {.name = "link",
          .summary = "Print a link through the redirect service",
          .output = "The link",
          .options = {{.letter = 'a',
                       .name = "action",
                       .description = "What the service is asked for",
                       .value = text("ACTION", command, &LinkCommand::action)}},
          .operands = {.value = text("WORD", command, &LinkCommand::words),
                       .description = "A URL; with an action, parameters KEY=VALUE",
                       .max = Operands::anyNumber},
          .run = runs(command)};
}

Command menu() {
  return {.name = "menu",
          .summary = "List the identifiers of the main menu's items",
          .output = "An identifier a line",
          .run = runs(std::make_shared<MenuCommand>())};
}

Command origin() {
  const auto command = std::make_shared<OriginCommand>();
  return {.name = "origin",
          .summary = "Tell where this program, or a file, was downloaded from",
          .output = "A fact a line, \"none\" where there is none",
          .fields = {schemaVersion,
                     {"file", "the file; of a file only, as flags, date and agentName"},
                     {"flags", "of the download, as the attribute has them"},
                     {"date", "of the download, in UTC"},
                     {"agentName", "the program that downloaded it"},
                     {"eventIdentifier", "of the download"},
                     {"dataURL", "where it was downloaded from"}},
          .options = {json(command)},
          .operands = {.value = text("FILE", command, &OriginCommand::file, Value::Kind::file),
                       .description = "The file; this program when none is named",
                       .max = 1},
          .run = runs(command)};
}

Command path() {
  const auto command = std::make_shared<PathCommand>();
  return {.name = "path",
          .summary = "Show paths in their short form",
          .output = "A path a line",
          .options = {{.letter = 'e',
                       .name = "expand",
                       .description = "Show short forms in full",
                       .value = flag(command, &PathCommand::expands)}},
          .operands = {.value = text("PATH", command, &PathCommand::paths, Value::Kind::file),
                       .description = "The paths; a folder's ends with a slash",
                       .min = 1,
                       .max = Operands::anyNumber},
          .run = runs(command)};
}

// "onceInTwoWeeks" as "once-in-two-weeks".
std::string withDashes(const std::string& name) {
  std::string words;
  for (const char letter : name) {
    if (std::isupper(letter) != 0) words += '-';
    words += static_cast<char>(std::tolower(letter));
  }
  return words;
}

constexpr const char* reminders = "The period and the notifications, a line each";

Command remindEvery() {
  const auto command = std::make_shared<RemindEveryCommand>();
  std::vector<std::pair<std::string, Varnel::SchedulePeriodOption>> periods;
  std::vector<std::pair<std::string, Varnel::SchedulePeriodOption>> formerNames;
  for (const auto period : Varnel::SchedulePeriodOption::optionsAvailableToUser()) {
    formerNames.emplace_back(period.accessibilityIdentifier(), period);
    periods.emplace_back(withDashes(formerNames.back().first), period);
  }
  return {.name = "remind every",
          .summary = "Choose how often to remind the user to clean up",
          .output = reminders,
          .operands = {.value = word("PERIOD", command, &RemindEveryCommand::period, periods,
                                     formerNames),
                       .description = "The time between two reminders",
                       .min = 1,
                       .max = 1},
          .run = runs(command)};
}

Command remindTomorrow() {
  const auto command = std::make_shared<RemindTomorrowCommand>();
  return {.name = "remind tomorrow",
          .summary = "Remind the user tomorrow of what a scan has found",
          .output = reminders,
          .options = {{.letter = 'f',
                       .name = "found",
                       .description = "What the scan found, in bytes",
                       .value = byteCount(command, &RemindTomorrowCommand::foundSize),
                       .isRequired = true},
                      {.letter = 's',
                       .name = "selected",
                       .description = "What the user had selected, in bytes",
                       .value = byteCount(command, &RemindTomorrowCommand::selectedSize),
                       .isRequired = true}},
          .run = runs(command)};
}

Command remindStatus() {
  return {.name = "remind status",
          .summary = "Tell the period and list the notifications",
          .output = reminders,
          .run = runs(std::make_shared<RemindStatusCommand>())};
}

Command remindListen() {
  return {.name = "remind listen",
          .summary = "Show what happens to reminders, until it is interrupted",
          .output = "A line for each that is delivered or clicked",
          .run = runs(std::make_shared<RemindListenCommand>())};
}

Command sound() {
  const auto command = std::make_shared<SoundCommand>();
  using enum Varnel::Sound::Case;
  return {.name = "sound",
          .summary = "Play a sound",
          .output = "Nothing",
          .operands = {.value = word("SOUND", command, &SoundCommand::sound,
                                     {{"tutorial", tutorial},
                                      {"start", start},
                                      {"scan-complete", scanComplete},
                                      {"clean-complete", cleanComplete},
                                      {"achievement-notification", achievementNotification},
                                      {"rank-increased", rankIncreased},
                                      {"purchase", purchase}}),
                       .description = "The sound",
                       .min = 1,
                       .max = 1},
          .run = runs(command)};
}

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
               .value = flag(wishes, &Wishes::logToStandardOutput)}},
      commands{scan(),         disks(),   help(),        manual(),         completion(),
               analytics(),    consent(), identify(),    link(),           menu(),
               origin(),       path(),    remindEvery(), remindTomorrow(), remindStatus(),
               remindListen(), sound()} {}

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
