// SPDX-License-Identifier: MIT
#include <orvane/ShareCommand.h>

#include <chrono>
#include <cstdint>

#include <Removal/Sharing.h>
#include <Scan/ScanObserver.h>
#include <Varnel/DiskAccess/DiskAccessManager.h>
#include <Varnel/DiskWatch/DiskAccessWatcher.h>
#include <Varnel/Paths/QNURLResolver.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Ports/UserLocale.h>
#include <Varnel/Platform/Text/ByteCountFormatter.h>
#include <orvane/Console.h>
#include <orvane/Interruption.h>
#include <orvane/ReportSource.h>
#include <orvane/ResultText.h>
#include <orvane/SharingText.h>
#include <orvane/StandardStreams.h>
#include <orvane/TrashCommand.h>

namespace Orvane {
namespace {

using Varnel::Platform::ByteCountFormatter;

/// Makes all steps, with a line of progress on a terminal.
class Progress final {
 public:
  Progress(Console& console, const ByteCountFormatter& byteCounts)
      : console_(console), byteCounts_(byteCounts), isShown_(isStandardErrorATerminal()) {}

  void show(const Sharing& sharing) {
    if (!isShown_ || Clock::now() < next_) return;
    const auto bytes = static_cast<std::int64_t>(sharing.comparedBytes());
    console_.showStatus("Sharing: " + std::to_string(sharing.countMade()) + " of " +
                        counted(sharing.steps().size(), "file", "files") + ", " +
                        byteCounts_.string(bytes, Varnel::Platform::ByteCountStyle::file));
    next_ = Clock::now() + std::chrono::milliseconds(100);
  }

 private:
  using Clock = std::chrono::steady_clock;

  Console& console_;
  const ByteCountFormatter& byteCounts_;
  const bool isShown_;
  Clock::time_point next_ = Clock::now();
};

}  // namespace

int ShareCommand::run(Console& console) const {
  ScanControl control;
  const Interruption interruption(control.isCancelled);
  const auto report = reportFrom(operands, console, control);
  if (!report) return interruption.signal() != 0 ? 128 + interruption.signal() : 1;

  const Varnel::Platform::Ports& ports = Varnel::Platform::processPorts();
  const ByteCountFormatter byteCounts(ports.userLocale.get().numberIdentifier());
  Progress progress(console, byteCounts);
  const Varnel::DiskAccessWatcher watcher("orvane");
  Sharing sharing({.fileSystem = systemFileSystem(), .disks = Varnel::DiskAccessManager::shared()},
                  *report, isTrial ? Sharing::Mode::trial : Sharing::Mode::real,
                  control.isCancelled);
  while (sharing.next([&] { progress.show(sharing); })) continue;
  console.clearStatus();

  const SharingForm form{.columns = isStandardOutputATerminal() ? standardOutputColumns() : 0,
                         .isTrial = isTrial};
  const auto write = [&](std::string_view text) { return console.writeResult(text); };
  const bool isWritten = isJSON
                             ? writeJSON(sharing, write)
                             : writeText(sharing, form, Varnel::QNURLResolver::shared(), write) &&
                                   write(summaryOf(sharing, form, byteCounts));
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
