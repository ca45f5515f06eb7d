// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <limits>
#include <optional>
#include <string>
#include <vector>

#include <Scan/ScanRequest.h>
#include <orvane/FileList.h>

namespace Orvane {

class Console;

/// What the user wants to be scanned, as the options and operands of a command say it. See
/// `ScanRequest`.
struct ScanChoice {
  std::vector<std::string> folders;
  std::vector<std::string> references;
  std::vector<std::string> include;
  std::vector<std::string> exclude;
  std::uint64_t minSize = 0;
  std::uint64_t maxSize = std::numeric_limits<std::uint64_t>::max();
  bool skipsHidden = false;
  bool staysOnFileSystem = false;
  std::optional<std::string> listOfFiles;  ///< A file that names further ones.
  NameEnd endOfNames = NameEnd::line;

  /// The same for the engine, or nothing after a complaint about a folder or list that is not
  /// there.
  [[nodiscard]] std::optional<ScanRequest> request(Console& console) const;
};

void complainThatItCannotScan(const std::string& folder, const std::string& reason,
                              Console& console);

}  // namespace Orvane
