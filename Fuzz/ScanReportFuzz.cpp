// SPDX-License-Identifier: MIT
// Reports of scans. Their paths are such as the file system gives.
#include <sstream>

#include <Fuzz/Fuzz.h>
#include <Removal/Report.h>

using namespace Orvane;

static void checkPath(const std::string& path) {
  require(path.starts_with('/') && path.find('\0') == path.npos && path.find("//") == path.npos);
}

static void fuzz(std::string_view input) {
  std::istringstream text{std::string(input)};
  const auto report = readReport(text);
  if (!report) return require(!report.error().empty());
  for (const ReportGroup& group : report->groups)
    for (const ReportFile& file : group.files) {
      checkPath(file.path);
      for (const std::string& name : file.names) checkPath(name);
      require(file.nanoseconds >= 0 && file.nanoseconds < 1'000'000'000);
    }
}
