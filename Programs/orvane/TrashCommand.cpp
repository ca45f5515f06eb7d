// SPDX-License-Identifier: MIT
#include <orvane/TrashCommand.h>

#include <atomic>
#include <string>

#include <Removal/DpkgFiles.h>
#include <Removal/Removal.h>
#include <Scan/FileSystem.h>
#include <Varnel/DiskAccess/DiskAccessManager.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <orvane/ActOnReport.h>
#include <orvane/Console.h>
#include <orvane/PeriodicStatus.h>
#include <orvane/RemovalText.h>
#include <orvane/ShownText.h>
#include <orvane/StandardStreams.h>

namespace Orvane {
namespace {

std::string textOf(const Removal::Problem& problem) {
  using enum Removal::Problem::Reason;
  switch (problem.reason) {
    case selection:
      return "the report names a file that stays also as one that goes (" + problem.description +
             ")";
    case noTrash:
      return "there is no trash for \"" + problem.path + "\"";
    case packages:
      return "cannot tell what the package system owns: " + problem.description +
             " (--allow-packaged)";
    case journal:
      return "cannot write the journal: " + problem.description;
    case busy:
      break;
  }
  return "another removal or restoration is at work";
}

int fail(const Removal::Problem& problem, Console& console) {
  console.complain(textOf(problem) + "; nothing was moved");
  return 1;
}

void move(Removal& removal, Console& console) {
  PeriodicStatus status(console);
  const std::string of = " of " + counted(removal.steps().size(), "file", "files");
  while (const RemovalStep* step = removal.next())
    status.show([&] {
      return "Moving to the trash: " + std::to_string(step - removal.steps().data() + 1) + of;
    });
}

}  // namespace

int TrashCommand::run(Console& console) const {
  return actOnReport(operands, console,
                     [&](const Report& report, const std::atomic<bool>& shouldStop) {
                       return moveOrShow(report, shouldStop, console);
                     });
}

int TrashCommand::moveOrShow(const Report& report, const std::atomic<bool>& shouldStop,
                             Console& console) const {
  const Varnel::Platform::Ports& ports = Varnel::Platform::processPorts();
  const Selection selection = select(
      report, keep, [&](const std::string& path) { return ports.trash.get().isInTrash(path); });

  RemovalJournal journal({ports.privateFiles, ports.systemLog}, RemovalJournal::productPath());
  DpkgFiles packagedFiles;
  Removal removal({.fileSystem = systemFileSystem(CacheUse::traceless),
                   .disks = Varnel::DiskAccessManager::shared(),
                   .trash = ports.trash,
                   .packagedFiles = packagedFiles,
                   .journal = journal,
                   .clock = ports.clock},
                  report, selection,
                  {.hiddenFolders = allowsHiddenFolders,
                   .otherFileSystems = allowsOtherFileSystems,
                   .packagedFiles = allowsPackagedFiles,
                   .hardLinks = allowsHardLinks},
                  shouldStop);
  if (const auto problem = removal.prepare()) return fail(*problem, console);
  const bool isMade = moves && !shouldStop;
  if (isMade && removal.totals().planned > 0) {
    if (const auto problem = removal.begin()) return fail(*problem, console);
    move(removal, console);
  }

  const RemovalForm form{.columns = isStandardOutputATerminal() ? standardOutputColumns() : 0,
                         .isMade = isMade};
  const auto write = [&](std::string_view text) { return console.writeResult(text); };
  const RemovalTotals totals = removal.totals();
  const std::string giveBack = "\"orvane restore " + std::to_string(removal.number()) + "\" gives ";
  bool isWritten =
      isJSON ? writeJSON(removal, selection, write) : writeText(removal, selection, form, write);
  if (isWritten && !isJSON) {
    std::string summary = summaryOf(removal, form);
    if (!moves && totals.planned > 0) summary += "nothing was moved yet: --yes does it\n";
    if (totals.moved > 0) summary += giveBack + "them back\n";
    isWritten = console.writeResult(wrapped(summary, form.columns));
  }
  if (!isWritten && totals.moved > 0 && !console.hasLostReader())
    console.complain(giveBack + "back what was moved to the trash");
  if (!isWritten) return 1;
  return moves && totals.notMoved > 0 ? someNotMoved : 0;
}

}  // namespace Orvane
