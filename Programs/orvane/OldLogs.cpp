// SPDX-License-Identifier: MIT
#include <orvane/OldLogs.h>

#include <filesystem>

#include <orvane/ProductData.h>

namespace Orvane {
namespace {

namespace fs = std::filesystem;

bool isOld(const DataFile& log, Varnel::Platform::Date now) {
  std::error_code error;
  const auto written = fs::last_write_time(log.path, error);
  if (error) return false;
  return now - std::chrono::file_clock::to_sys(written) > maxLogAge;
}

}  // namespace

void removeOldLogs(Varnel::Platform::Date now) {
  for (const DataFile& log : productLogs())
    if (!log.objection && isOld(log, now)) static_cast<void>(removeFile(log));
}

}  // namespace Orvane
