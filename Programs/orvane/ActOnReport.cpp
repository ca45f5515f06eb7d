// SPDX-License-Identifier: MIT
#include <orvane/ActOnReport.h>

#include <cerrno>
#include <filesystem>
#include <fstream>
#include <iostream>
#include <utility>
#include <variant>

#include <Scan/ScanObserver.h>
#include <Varnel/DiskWatch/DiskAccessWatcher.h>
#include <orvane/Console.h>
#include <orvane/Interruption.h>
#include <orvane/ScanChoice.h>
#include <orvane/ScanLog.h>
#include <orvane/Search.h>

namespace Orvane {
namespace {

namespace fs = std::filesystem;

/// A report, or what is to be scanned for one.
using ReportSource = std::variant<Report, ScanRequest>;

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

std::optional<Report> scan(const ScanRequest& request, Console& console, ScanControl& control) {
  ScanLog log(console);
  const ScanResult result = search(request, {}, log, console, control);
  if (control.isCancelled) return std::nullopt;
  log.complain();
  for (const LostPath& lost : result.lostFolders)
    complainThatItCannotScan(lost.path, reasonOf(lost.loss), console);
  if (!result.lostFolders.empty()) return std::nullopt;
  Report report = reportOf(result);
  report.roots = request.folders;
  return report;
}

template <typename Source>
std::optional<ReportSource> sourceOf(std::optional<Source> found) {
  if (!found) return std::nullopt;
  return *std::move(found);
}

/// None after a complaint. Looks up and reads, which may take for ever.
std::optional<ReportSource> findSource(const std::vector<std::string>& operands, Console& console) {
  const std::string& name = operands.front();
  std::error_code ignored;
  if (operands.size() > 1 || fs::is_directory(name, ignored)) {
    ScanChoice choice;
    choice.folders = operands;
    return sourceOf(choice.request(console));
  }
  if (name == "-") return sourceOf(read(std::cin, name, console));
  errno = 0;
  std::ifstream file(name, std::ios::binary);
  if (file) return sourceOf(read(file, name, console));
  console.complain("cannot read \"" + name +
                   "\": " + std::error_code(errno, std::generic_category()).message());
  return std::nullopt;
}

/// None after a complaint, or once `control` asks to stop.
std::optional<Report> reportFrom(ReportSource source, Console& console, ScanControl& control) {
  if (auto* report = std::get_if<Report>(&source)) return std::move(*report);
  return scan(std::get<ScanRequest>(source), console, control);
}

}  // namespace

int actOnReport(const std::vector<std::string>& operands, Console& console, const ReportAct& act) {
  auto source = findSource(operands, console);
  if (!source) return 1;
  ScanControl control;
  const Interruption interruption(control.isCancelled);
  int status = 1;
  if (const auto report = reportFrom(*std::move(source), console, control)) {
    const Varnel::DiskAccessWatcher watcher("orvane");
    status = act(*report, control.isCancelled);
  }
  return interruption.signal() != 0 ? 128 + interruption.signal() : status;
}

}  // namespace Orvane
