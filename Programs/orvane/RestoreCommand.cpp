// SPDX-License-Identifier: MIT
#include <orvane/RestoreCommand.h>

#include <atomic>
#include <string>

#include <Removal/Restoration.h>
#include <Varnel/DiskAccess/DiskAccessManager.h>
#include <Varnel/DiskWatch/DiskAccessWatcher.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Text/DateFormatter.h>
#include <orvane/Console.h>
#include <orvane/Interruption.h>
#include <orvane/ShownText.h>
#include <orvane/TrashCommand.h>

namespace Orvane {
namespace {

using Outcome = RestorationStep::Outcome;

std::string textOf(const RemovalRecord& record) {
  static const Varnel::Platform::DateFormatter dates("yyyy-MM-dd HH:mm", "en_US",
                                                     Varnel::Platform::processPorts().timeZones);
  std::string text = std::to_string(record.number) + "  " + dates.string(record.began) + "  " +
                     counted(record.files, "file", "files") + ", " + shownSize(record.bytes);
  if (record.restored > 0) text += ", " + std::to_string(record.restored) + " back in place";
  if (record.lost > 0) text += ", " + std::to_string(record.lost) + " no more in the trash";
  return text + "\n";
}

int list(RemovalJournal& journal, Console& console) {
  const auto removals = journal.removals();
  if (!removals) {
    console.complain("cannot read the journal: " + removals.error().localizedDescription());
    return 1;
  }
  std::string text;
  for (const RemovalRecord& record : *removals) text += textOf(record);
  return console.writeResult(text) ? 0 : 1;
}

std::string textOf(const Restoration::Problem& problem, std::optional<std::int64_t> number) {
  switch (problem.reason) {
    case Restoration::Problem::Reason::unknown:
      return number ? "there is no removal " + std::to_string(*number) + " (orvane restore --list)"
                    : "there is no removal with something to give back";
    case Restoration::Problem::Reason::journal:
      return "cannot use the journal: " + problem.description;
    case Restoration::Problem::Reason::busy:
      break;
  }
  return "another removal or restoration is at work";
}

/// Empty for a file that is in its place.
std::string whyNot(Outcome outcome) {
  switch (outcome) {
    case Outcome::emptied:
      return "is no more in the trash, which was emptied meanwhile";
    case Outcome::occupied:
      return "stays in the trash: something else has its place";
    case Outcome::noTrash:
      return "stays in the trash of a disk that is not there";
    case Outcome::noAccess:
      return "stays in the trash: its disk gives no access";
    case Outcome::failed:
      return "stays in the trash";
    case Outcome::planned:
    case Outcome::restored:
    case Outcome::inPlace:
      break;
  }
  return {};
}

}  // namespace

int RestoreCommand::run(Console& console) const {
  const Varnel::Platform::Ports& ports = Varnel::Platform::processPorts();
  RemovalJournal journal({ports.privateFiles, ports.systemLog}, RemovalJournal::productPath());
  if (lists) return list(journal, console);
  const Varnel::DiskAccessWatcher watcher("orvane");
  Restoration restoration(
      {.disks = Varnel::DiskAccessManager::shared(), .trash = ports.trash, .journal = journal},
      number);
  if (const auto problem = restoration.begin()) {
    console.complain(textOf(*problem, number));
    return 1;
  }

  std::atomic<bool> shouldStop = false;
  const Interruption interruption(shouldStop);
  std::uint64_t restored = 0, left = 0, unnoted = 0;
  bool isWritten = true;
  while (!shouldStop) {
    const RestorationStep* const step = restoration.next();
    if (!step) break;
    const std::string why = whyNot(step->outcome);
    ++(why.empty() ? restored : left);
    unnoted += step->isUnnoted;
    std::string line = shownPath(step->entry.file.path);
    if (!why.empty()) line += " " + why;
    if (!why.empty() && step->code) line += " (" + step->code.message() + ")";
    isWritten = isWritten && console.writeResult(line + "\n");
  }
  if (unnoted > 0)
    console.complain("the journal could not be written, and still names " +
                     counted(unnoted, "file that is back", "files that are back"));
  const std::uint64_t notReached = restoration.steps().size() - restored - left;
  std::string summary = counted(restored, "file is", "files are") + " back in place";
  if (left > 0) summary += ", " + std::to_string(left) + " not";
  if (notReached > 0) summary += ", " + std::to_string(notReached) + " not reached";
  isWritten = isWritten && console.writeResult(summary + "\n");
  if (interruption.signal() != 0) return 128 + interruption.signal();
  if (!isWritten) return 1;
  return left > 0 ? someNotMoved : 0;
}

}  // namespace Orvane
