// SPDX-License-Identifier: MIT
#include <orvane/ShareCommand.h>

#include <atomic>

#include <Removal/Sharing.h>
#include <Scan/FileSystem.h>
#include <Varnel/DiskAccess/DiskAccessManager.h>
#include <orvane/ActOnReport.h>
#include <orvane/Console.h>
#include <orvane/PeriodicStatus.h>
#include <orvane/SharingText.h>
#include <orvane/ShownText.h>
#include <orvane/StandardStreams.h>
#include <orvane/TrashCommand.h>

namespace Orvane {
namespace {

void makeAllSteps(Sharing& sharing, Console& console) {
  PeriodicStatus status(console);
  const auto text = [&] {
    return "Sharing: " + std::to_string(sharing.countMade()) + " of " +
           counted(sharing.steps().size(), "file", "files") + ", " +
           shownSize(sharing.comparedBytes());
  };
  while (sharing.next([&] { status.show(text); })) continue;
}

}  // namespace

int ShareCommand::run(Console& console) const {
  return actOnReport(operands, console,
                     [&](const Report& report, const std::atomic<bool>& shouldStop) {
                       return share(report, shouldStop, console);
                     });
}

int ShareCommand::share(const Report& report, const std::atomic<bool>& shouldStop,
                        Console& console) const {
  Sharing sharing({.fileSystem = systemFileSystem(), .disks = Varnel::DiskAccessManager::shared()},
                  report, isTrial ? Sharing::Mode::trial : Sharing::Mode::real, shouldStop);
  makeAllSteps(sharing, console);

  const SharingForm form{.columns = isStandardOutputATerminal() ? standardOutputColumns() : 0,
                         .isTrial = isTrial};
  const auto write = [&](std::string_view text) { return console.writeResult(text); };
  const bool isWritten = isJSON ? writeJSON(sharing, write)
                                : writeText(sharing, form, write) &&
                                      write(wrapped(summaryOf(sharing, form), form.columns));
  if (!isWritten) return 1;
  const SharingTotals totals = sharing.totals();
  if (!totals.isSupported) {
    console.complain("no file system of these files can share extents");
    return 1;
  }
  return totals.notShared > 0 ? someNotMoved : 0;
}

}  // namespace Orvane
