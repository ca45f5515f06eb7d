// SPDX-License-Identifier: MIT
#include <orvane/CommandGroups.h>

#include <orvane/AnalyticsCommand.h>
#include <orvane/CommandParts.h>
#include <orvane/IdentifyCommand.h>
#include <orvane/LinkCommand.h>
#include <orvane/MenuCommand.h>
#include <orvane/OriginCommand.h>
#include <orvane/PathCommand.h>
#include <orvane/SoundCommand.h>

namespace Orvane {
namespace {

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

Command reset() {
  const auto command = std::make_shared<AnalyticsCommand>();
  command->resets = true;
  return {.name = "analytics reset",
          .summary =
              "Forget the random identifier that events carry, and throw away those that wait; the "
              "next ones carry another",
          .output = "The answer to whether events may be sent",
          .run = runs(command)};
}

Command identify() {
  const auto command = std::make_shared<IdentifyCommand>();
  return {.name = "identify",
          .summary = "Print what this installation is recognised by",
          .output = "A fact a line, \"none\" where there is none",
          .fields = {schemaVersionField,
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
          .fields = {schemaVersionField,
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

}  // namespace

std::vector<Command> serviceCommands() {
  return {analytics(), consent(), reset(), identify(), link(), menu(), origin(), path(), sound()};
}

}  // namespace Orvane
