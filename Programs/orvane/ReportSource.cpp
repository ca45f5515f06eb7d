// SPDX-License-Identifier: MIT
#include <orvane/ReportSource.h>

#include <algorithm>
#include <cerrno>
#include <filesystem>
#include <fstream>
#include <iostream>
#include <thread>
#include <utility>

#include <Scan/DuplicateFinder.h>
#include <Scan/FileSystem.h>
#include <Scan/ScanObserver.h>
#include <Varnel/DiskWatch/DiskAccessWatcher.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <orvane/Console.h>
#include <orvane/ManagedDiskTurns.h>
#include <orvane/ProgressLine.h>
#include <orvane/ScanChoice.h>
#include <orvane/ScanLog.h>
#include <orvane/StandardStreams.h>

namespace Orvane {
namespace {

namespace fs = std::filesystem;

std::optional<Report> read(std::istream& text, const std::string& name, Console& console) {
  auto report = readReport(text);
  if (!report) {
    console.complain("\"" + name + "\" is no report of a scan: " + report.error());
    return std::nullopt;
  }
  if (report->isPartial)
    console.complain("the scan was interrupted, so the report may not name all duplicates");
  return std::move(*report);
}

std::optional<Report> scan(const std::vector<std::string>& folders, Console& console,
                           ScanControl& control) {
  ScanChoice choice;
  choice.folders = folders;
  const auto request = choice.request(console);
  if (!request) return std::nullopt;
  const unsigned maxReaders = std::max(2u, std::thread::hardware_concurrency() / 2);
  const Varnel::DiskAccessWatcher watcher("orvane");
  ManagedDiskTurns turns({.queue = ManagedDiskTurns::sharedQueue(),
                          .volumes = Varnel::Platform::processPorts().volumeCatalog},
                         Varnel::Platform::QualityOfService::utility, maxReaders);
  ScanLog log(console);
  DuplicateFinder finder(
      {.fileSystem = systemFileSystem(CacheUse::traceless), .turns = turns, .observer = log});
  std::optional<ProgressLine> progress;
  if (isStandardErrorATerminal()) progress.emplace(console, control);
  const ScanResult result = finder.find(*request, control);
  progress.reset();
  if (control.isCancelled) return std::nullopt;
  log.complain();
  for (const LostPath& lost : result.lostFolders)
    complainThatItCannotScan(lost.path, reasonOf(lost.loss), console);
  if (!result.lostFolders.empty()) return std::nullopt;
  Report report = reportOf(result);
  report.roots = request->folders;
  return report;
}

}  // namespace

std::optional<Report> reportFrom(const std::vector<std::string>& operands, Console& console,
                                 ScanControl& control) {
  const std::string& name = operands.front();
  std::error_code ignored;
  if (operands.size() > 1 || fs::is_directory(name, ignored))
    return scan(operands, console, control);
  if (name == "-") return read(std::cin, name, console);
  errno = 0;
  std::ifstream file(name, std::ios::binary);
  if (file) return read(file, name, console);
  console.complain("cannot read \"" + name +
                   "\": " + std::error_code(errno, std::generic_category()).message());
  return std::nullopt;
}

}  // namespace Orvane
