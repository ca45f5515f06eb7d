// SPDX-License-Identifier: MIT
#include <orvane/ProgressLine.h>

#include <algorithm>
#include <condition_variable>
#include <mutex>
#include <optional>
#include <string_view>
#include <vector>

#include <Scan/ScanObserver.h>
#include <Varnel/Platform/Concurrency/StartThread.h>
#include <orvane/Console.h>
#include <orvane/ShownText.h>
#include <orvane/StandardStreams.h>

namespace Orvane {
namespace {

std::string megabytes(std::uint64_t bytes) {
  return std::to_string(bytes / 1'000'000);
}

/// "45 s", "12 min", "3 h".
std::string timeText(double seconds) {
  const auto whole = static_cast<std::uint64_t>(seconds);
  if (whole < 100) return std::to_string(whole) + " s";
  return whole < 6000 ? std::to_string(whole / 60) + " min" : std::to_string(whole / 3600) + " h";
}

}  // namespace

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
  using std::chrono::steady_clock;
  std::mutex mutex;
  std::condition_variable_any stopped;
  std::unique_lock lock(mutex);
  std::optional<steady_clock::time_point> begin;
  do {
    const auto now = steady_clock::now();
    if (!begin && control_.filesToRead > 0) begin = now;
    const auto readingTime =
        std::chrono::duration_cast<std::chrono::milliseconds>(now - begin.value_or(now));
    // A line that fills the last column would wrap on some terminals.
    console_.showStatus(text(control_, readingTime, standardErrorColumns() - 1));
    stopped.wait_for(lock, stop, std::chrono::milliseconds(100), [] { return false; });
  } while (!stop.stop_requested());
}

std::string ProgressLine::text(const ScanControl& control, std::chrono::milliseconds readingTime,
                               std::size_t columns) {
  const std::uint64_t files = control.filesToRead;
  const std::uint64_t bytes = control.bytesToRead;
  const std::uint64_t read = std::min<std::uint64_t>(control.bytesRead, bytes);
  std::vector<std::string> parts;
  if (files == 0) {
    parts.push_back("Looking: " + counted(control.filesFound, "file", "files"));
  } else {
    parts.push_back("Reading: " + megabytes(read) + " of " + megabytes(bytes) + " MB");
    const double seconds = std::chrono::duration<double>(readingTime).count();
    if (seconds >= 1 && read > 0) {
      const double rate = static_cast<double>(read) / seconds;
      parts.push_back(timeText(static_cast<double>(bytes - read) / rate) + " left");
      parts.push_back(megabytes(static_cast<std::uint64_t>(rate)) + " MB/s");
    }
    parts.push_back(std::to_string(std::min<std::uint64_t>(control.filesRead, files)) + " of " +
                    counted(files, "file", "files"));
  }
  std::string line;
  for (const std::string& part : parts) {
    const std::string_view separator = line.empty() ? "" : ", ";
    if (line.size() + separator.size() + part.size() > columns) break;
    line.append(separator).append(part);
  }
  return line.empty() ? parts.front().substr(0, columns) : line;
}

}  // namespace Orvane
