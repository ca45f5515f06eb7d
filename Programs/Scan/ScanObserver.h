// SPDX-License-Identifier: MIT
#pragma once

#include <atomic>
#include <cstdint>
#include <string>

#include <Scan/Loss.h>

namespace Orvane {

/// Hears what a scan leaves out. Called on the thread that runs the scan, in the order of the
/// paths within each step.
class ScanObserver {
 public:
  virtual ~ScanObserver() = default;

  virtual void fileLeftOut(const std::string& path, const Loss& loss) = 0;
  virtual void folderLeftOut(const std::string& path, const Loss& loss) = 0;
};

/// How far a running scan is, for any thread to look at, and the wish to stop it, for any thread or
/// signal handler to set. The figures are taken one by one and need not fit together.
struct ScanControl {
  std::atomic<bool> isCancelled{false};
  std::atomic<std::uint64_t> filesFound{0};
  std::atomic<std::uint64_t> filesToRead{0};
  std::atomic<std::uint64_t> filesRead{0};
  std::atomic<std::uint64_t> bytesRead{0};
};

}  // namespace Orvane
