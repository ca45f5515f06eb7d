// SPDX-License-Identifier: MIT
#include <orvane/CommandGroups.h>

#include <cctype>

#include <orvane/CommandParts.h>
#include <orvane/RemindCommands.h>

namespace Orvane {
namespace {

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

}  // namespace

std::vector<Command> reminderCommands() {
  return {remindEvery(), remindTomorrow(), remindStatus(), remindListen()};
}

}  // namespace Orvane
