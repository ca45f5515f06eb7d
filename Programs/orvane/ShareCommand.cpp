// SPDX-License-Identifier: MIT
#include <orvane/ShareCommand.h>

#include <chrono>

#include <Removal/Sharing.h>
#include <Scan/ScanObserver.h>
#include <Varnel/DiskAccess/DiskAccessManager.h>
#include <Varnel/DiskWatch/DiskAccessWatcher.h>
#include <orvane/Console.h>
#include <orvane/Interruption.h>
#include <orvane/ReportSource.h>
#include <orvane/SharingText.h>
#include <orvane/ShownText.h>
#include <orvane/StandardStreams.h>
#include <orvane/TrashCommand.h>

namespace Orvane {
namespace {

/// Makes all steps, with a line of progress on a terminal.
class Progress final {
 public:
  explicit Progress(Console& console) : console_(console), isShown_(isStandardErrorATerminal()) {}

  void show(const Sharing& sharing) {
    if (!isShown_ || Clock::now() < next_) return;
    console_.showStatus("Sharing: " + std::to_string(sharing.countMade()) + " of " +
                        counted(sharing.steps().size(), "file", "files") + ", " +
                        shownSize(sharing.comparedBytes()));
    next_ = Clock::now() + std::chrono::milliseconds(100);
  }

 private:
  using Clock = std::chrono::steady_clock;

  Console& console_;
  const bool isShown_;
  Clock::time_point next_ = Clock::now();
};

}  // namespace

int ShareCommand::run(Console& console) const {
  auto source = findSource(operands, console);
  if (!source) return 1;
  ScanControl control;
  const Interruption interruption(control.isCancelled);
  const auto report = reportFrom(*std::move(source), console, control);
  if (!report) return interruption.signal() != 0 ? 128 + interruption.signal() : 1;

  Progress progress(console);
  const Varnel::DiskAccessWatcher watcher("orvane");
  Sharing sharing({.fileSystem = systemFileSystem(), .disks = Varnel::DiskAccessManager::shared()},
                  *report, isTrial ? Sharing::Mode::trial : Sharing::Mode::real,
                  control.isCancelled);
  while (sharing.next([&] { progress.show(sharing); })) continue;
  console.clearStatus();

  const SharingForm form{.columns = isStandardOutputATerminal() ? standardOutputColumns() : 0,
                         .isTrial = isTrial};
  const auto write = [&](std::string_view text) { return console.writeResult(text); };
  const bool isWritten = isJSON ? writeJSON(sharing, write)
                                : writeText(sharing, form, write) &&
                                      write(wrapped(summaryOf(sharing, form), form.columns));
  if (interruption.signal() != 0) return 128 + interruption.signal();
  if (!isWritten) return 1;
  const SharingTotals totals = sharing.totals();
  if (!totals.isSupported) {
    console.complain("no file system of these files can share extents");
    return 1;
  }
  return totals.notShared > 0 ? someNotMoved : 0;
}

}  // namespace Orvane
