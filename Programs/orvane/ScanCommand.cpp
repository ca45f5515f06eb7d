// SPDX-License-Identifier: MIT
#include <orvane/ScanCommand.h>

#include <algorithm>
#include <chrono>
#include <cstdint>
#include <limits>
#include <optional>

#include <Scan/ScanObserver.h>
#include <Varnel/Logging/Logger.h>
#include <Varnel/Logging/LoggingObject.h>
#include <Varnel/Paths/QNURLResolver.h>
#include <Varnel/Platform/Ports/Clock.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Ports/UserLocale.h>
#include <Varnel/Platform/Text/ByteCountFormatter.h>
#include <orvane/Console.h>
#include <orvane/Interruption.h>
#include <orvane/ProgressLine.h>
#include <orvane/ReminderPlanner.h>
#include <orvane/Reminders.h>
#include <orvane/ResultText.h>
#include <orvane/ScanAnalytics.h>
#include <orvane/ScanLog.h>
#include <orvane/ScanReport.h>
#include <orvane/Search.h>
#include <orvane/ShownText.h>
#include <orvane/SoundCommand.h>
#include <orvane/StandardStreams.h>

namespace Orvane {
namespace {

using Varnel::Platform::URL;

// A period from now on the user is reminded of what this scan has found. Who chose none is not.
void planReminder(std::uint64_t bytesLeftToClean, Console& console) {
  const auto period = storedPeriod();
  if (!period || *period == Varnel::SchedulePeriodOption::never) return;
  constexpr std::uint64_t max = std::numeric_limits<std::int64_t>::max();
  // It says itself what is in its way; the scan has succeeded all the same.
  static_cast<void>(ReminderPlanner(console).planRegular(
      *period, static_cast<std::int64_t>(std::min(bytesLeftToClean, max))));
}

/// Who asks for urgent reading may want the files again.
CacheUse cacheUseOf(Varnel::Platform::QualityOfService qos) {
  using enum Varnel::Platform::QualityOfService;
  return qos == background || qos == utility ? CacheUse::traceless : CacheUse::normal;
}

std::string howFar(const ScanControl& control) {
  if (control.filesToRead == 0)
    return counted(control.filesFound, "file was found", "files were found");
  return std::to_string(control.filesRead) + " of " +
         counted(control.filesToRead, "file was read", "files were read");
}

std::chrono::sys_seconds startOfScan(const Varnel::Platform::Clock& clock) {
  return std::chrono::floor<std::chrono::seconds>(clock.now());
}

}  // namespace

int ScanCommand::run(Console& console) const {
  const auto asked = request(console);
  if (!asked) return 1;

  ScanAnalytics analytics(analyticsEndpoint, printsEvents, console);
  analytics.scanStarted(asked->folders.size());
  ScanLog log(console);
  for (const auto* paths : {&asked->folders, &asked->references})
    for (const std::string& path : *paths) log.log("Will scan", URL::fileURLWithPath(path + "/"));

  ScanFacts facts{.startedAt = startOfScan(Varnel::Platform::processPorts().clock),
                  .folders = asked->folders};
  facts.folders.insert(facts.folders.end(), asked->references.begin(), asked->references.end());
  ScanControl control;
  const Interruption interruption(control.isCancelled);
  const SearchManner manner{
      .qos = qos, .cacheUse = cacheUseOf(qos), .showsProgress = showsProgress};
  const ScanResult result = search(*asked, manner, log, console, control);
  if (!result.lostFolders.empty()) {
    for (const LostPath& lost : result.lostFolders)
      complainThatItCannotScan(lost.path, reasonOf(lost.loss), console);
    return 1;
  }
  if (result.isPartial) {
    log.log("Did cancel");
    analytics.scanCancelled();
    console.complain("interrupted when " + howFar(control));
  } else {
    log.log("Did find " + counted(result.groups.size(), "group", "groups") +
            " of duplicates among " + counted(result.totals.files, "file", "files"));
    analytics.scanFinished(result.groups.size());
  }
  log.complain();
  const bool isWritten = write(result, facts, interruption, console);
  if (!result.isPartial) {
    planReminder(result.totals.wastedBytes, console);
    // The scan has succeeded even on a machine without sound.
    if (playsSound) playToTheEnd(Varnel::Sound::scanComplete);
  }
  if (!isWritten) return 1;
  return interruption.signal() != 0 ? 128 + interruption.signal() : 0;
}

bool ScanCommand::write(const ScanResult& result, const ScanFacts& facts,
                        const Interruption& interruption, Console& console) const {
  const auto send = [&](std::string_view text) { return console.writeResult(text); };
  if (form == Form::json) return writeReport(result, facts, maxGroups, send);
  if (form == Form::pathList) return writePathList(result, maxGroups, send);
  TextForm look{.maxGroups = maxGroups};
  if (isStandardOutputATerminal()) {
    look.columns = standardOutputColumns();
    look.endsWithMost = true;
    look.isBold = !refusesColours();
    // Who interrupts a list that runs over the screen wants no more of it; a file gets it whole.
    look.shouldStop = [&] { return interruption.signal() != 0; };
  }
  const Varnel::Platform::Ports& ports = Varnel::Platform::processPorts();
  const Varnel::Platform::ByteCountFormatter byteCounts(ports.userLocale.get().numberIdentifier());
  return writeText(result, look, byteCounts, Varnel::QNURLResolver::shared(), send);
}

}  // namespace Orvane
