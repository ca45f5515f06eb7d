// SPDX-License-Identifier: MIT
#include <orvane/ProgressLine.h>

#include <chrono>
#include <condition_variable>
#include <mutex>

#include <Scan/ScanObserver.h>
#include <Varnel/Platform/Concurrency/StartThread.h>
#include <orvane/Console.h>

namespace Orvane {

ProgressLine::ProgressLine(Console& console, const ScanControl& control)
    : console_(console),
      control_(control),
      thread_(Varnel::Platform::startThread("progress", [this] { show(stop_.get_token()); })) {}

ProgressLine::~ProgressLine() {
  stop_.request_stop();
  thread_.join();
  console_.clearStatus();
}

void ProgressLine::show(const std::stop_token& stop) {
  std::mutex mutex;
  std::condition_variable_any stopped;
  std::unique_lock lock(mutex);
  while (!stop.stop_requested()) {
    console_.showStatus(text(control_));
    stopped.wait_for(lock, stop, std::chrono::milliseconds(100), [] { return false; });
  }
}

std::string ProgressLine::text(const ScanControl& control) {
  const std::uint64_t toRead = control.filesToRead;
  if (toRead == 0) return std::to_string(control.filesFound) + " files found";
  return std::to_string(control.filesRead) + " of " + std::to_string(toRead) + " files read, " +
         std::to_string(control.bytesRead / 1'000'000) + " MB";
}

}  // namespace Orvane
