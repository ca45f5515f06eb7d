// SPDX-License-Identifier: MIT
#pragma once

#include <atomic>
#include <cstdint>
#include <string>

#include <Scan/Loss.h>

namespace Orvane {

/// Hears of everything that a scan leaves out, on the thread that runs the scan, in the order of
/// the paths within each step.
class ScanObserver {
 public:
  virtual ~ScanObserver() = default;

  virtual void fileLeftOut(const std::string& path, const Loss& loss) = 0;
  virtual void folderLeftOut(const std::string& path, const Loss& loss) = 0;

  /// The scan is going to read a file system whose files lie on another machine, mounted on this
  /// folder. Once for each, before it is touched, but where it was given or is mounted only while
  /// the scan runs; on any thread, one call at a time.
  virtual void networkEntered(const std::string& /*folder*/) {}
};

/// The progress of a running scan, which any thread may read, and the request to stop it, which any
/// thread or signal handler may set. The figures are read one by one and need not fit together.
struct ScanControl {
  std::atomic<bool> isCancelled{false};
  std::atomic<std::uint64_t> filesFound{0};
  std::atomic<std::uint64_t> filesToRead{0};
  std::atomic<std::uint64_t> filesRead{0};
  std::atomic<std::uint64_t> bytesToRead{0};  ///< As far as is known; it grows, as for the files.
  std::atomic<std::uint64_t> bytesRead{0};
};

}  // namespace Orvane
