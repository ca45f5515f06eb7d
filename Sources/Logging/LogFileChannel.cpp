// SPDX-License-Identifier: MIT
#include <Varnel/Logging/LogFileChannel.h>

#include <limits>
#include <system_error>
#include <utility>

#include <fmt/format.h>

#include <Varnel/Platform/Concurrency/CurrentThread.h>
#include <Varnel/Platform/Concurrency/StartThread.h>

namespace Varnel {
namespace {

constexpr std::size_t never = std::numeric_limits<std::size_t>::max();

// A burst may leave a large buffer behind; the memory of an ordinary one is kept.
constexpr std::size_t keptCapacity = std::size_t{1} << 20;

}  // namespace

LogFileChannel::LogFileChannel(Platform::AppendFiles& files, Platform::StandardOutput& output,
                               std::string path, LogWritePolicy policy, Start start)
    : files_(files),
      output_(output),
      path_(std::move(path)),
      policy_(policy),
      wakeMark_(never),
      isStarted_(start == Start::atOnce) {
  if (isStarted_) startWriter();
}

LogFileChannel::~LogFileChannel() {
  {
    const std::lock_guard lock(gatherMutex_);
    isClosing_ = true;
  }
  wakeUp_.notify_one();
  if (writer_.joinable()) writer_.join();
  flush();
}

void LogFileChannel::startWriter() {
  try {
    writer_ = Platform::startThread("Logging Queue", [this] { runWriter(); });
  } catch (const std::system_error&) {
    // Without another thread the log is still written, but by the caller.
    writeThrough();
  }
}

void LogFileChannel::append(std::string_view entry) {
  bool starts = false;
  bool wakes = false;
  bool writesNow = false;
  {
    const std::lock_guard lock(gatherMutex_);
    if (isEnded_) return;
    starts = !std::exchange(isStarted_, true);
    if (gathered_.bytes.empty()) since_ = Clock::now();
    gathered_.bytes += entry;
    ++gathered_.entries;
    writesNow = writesThrough_;
    wakes = gathered_.bytes.size() >= wakeMark_;
    if (wakes) wakeMark_ = never;
  }
  if (starts) startWriter();
  if (wakes) wakeUp_.notify_one();
  if (writesNow) flush();
}

void LogFileChannel::flush() {
  const std::lock_guard file(fileMutex_);
  {
    const std::lock_guard lock(gatherMutex_);
    if (!isStarted_) return;
    std::swap(gathered_, written_);
    since_ = Clock::now();
  }
  if (!std::exchange(isOpened_, true)) openFile();
  if (file_ && written_.entries > 0) write(written_);
  if (written_.bytes.capacity() > keptCapacity) written_.bytes = {};
  written_.bytes.clear();
  written_.entries = 0;
}

void LogFileChannel::writeThrough() {
  {
    const std::lock_guard lock(gatherMutex_);
    writesThrough_ = true;
  }
  flush();
}

void LogFileChannel::runWriter() {
  Platform::setCurrentThreadQuality(Platform::QualityOfService::background);
  flush();
  std::unique_lock lock(gatherMutex_);
  while (!isClosing_) {
    switch (policy_.step(gathered_.bytes.size(), Clock::now() - since_)) {
      case LogWritePolicy::Step::write:
        wakeMark_ = never;
        lock.unlock();
        flush();
        lock.lock();
        wakeUp_.wait_for(lock, policy_.pause, [this] { return isClosing_; });
        break;
      case LogWritePolicy::Step::waitForMark:
        wakeMark_ = policy_.highWaterMark;
        wakeUp_.wait_until(lock, since_ + policy_.interval);
        break;
      case LogWritePolicy::Step::waitForAnyByte:
        wakeMark_ = 1;
        wakeUp_.wait(lock);
        break;
    }
  }
}

void LogFileChannel::openFile() {
  auto file = files_.open(path_);
  if (file) {
    file_ = std::move(*file);
    return;
  }
  output_.print(
      fmt::format("Unable to write log to file {} with error {}\n", path_, file.error().value()));
  const std::lock_guard lock(gatherMutex_);
  isEnded_ = true;
}

void LogFileChannel::write(const Batch& batch) {
  const std::error_code failure = file_->append(batch.bytes);
  if (!failure) return;
  const std::string report =
      fmt::format("Did fail to write log to file with error {}\n", failure.message());
  for (std::size_t entry = 0; entry < batch.entries; ++entry) output_.print(report);
}

}  // namespace Varnel
