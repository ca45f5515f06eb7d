// SPDX-License-Identifier: MIT
#pragma once

#include <Scan/FileSystem.h>
#include <Scan/ScanRequest.h>
#include <Scan/ScanResult.h>
#include <Varnel/Platform/Values/QualityOfService.h>

namespace Orvane {

class Console;
class ScanObserver;
struct ScanControl;

/// How a search is made.
struct SearchManner {
  const char* program = "orvane";  ///< As it is called where all programs' reading is shown.
  Varnel::Platform::QualityOfService qos = Varnel::Platform::QualityOfService::utility;
  CacheUse cacheUse = CacheUse::traceless;
  bool showsProgress = true;  ///< While standard error is a terminal.
};

/// Finds the duplicates in the process's turns at the disks of this machine.
[[nodiscard]] ScanResult search(const ScanRequest& request, SearchManner manner,
                                ScanObserver& observer, Console& console, ScanControl& control);

}  // namespace Orvane
