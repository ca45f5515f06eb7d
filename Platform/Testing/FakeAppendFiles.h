// SPDX-License-Identifier: MIT
#pragma once

#include <condition_variable>
#include <cstddef>
#include <map>
#include <memory>
#include <mutex>
#include <string>
#include <string_view>
#include <system_error>

#include <Varnel/Platform/Ports/AppendFiles.h>
#include <Varnel/Platform/Testing/FaultPlan.h>
#include <Varnel/Platform/Values/SystemText.h>

namespace Varnel::Platform::Testing {

/// Files in memory whose disk fails, or hangs, by plan. Any thread; it must outlive
/// the files that it opened.
///
///     FakeAppendFiles files;
///     files.failure = std::errc::no_space_on_device;
///     files.faults->plan(Fault::fails, 2, 2);  // opening is the first call
///     …
///     files.waitForAppends(3);
///     EXPECT_EQ(files.text("/log"), "what the third one wrote");
class FakeAppendFiles final : public AppendFiles {
 public:
  /// Openings and appends. What fails writes nothing and answers with `failure`.
  std::shared_ptr<FaultPlan> faults = std::make_shared<FaultPlan>();
  std::errc failure = std::errc::io_error;

  [[nodiscard]] Result<std::unique_ptr<AppendFile>, std::error_code> open(
      const std::string& path) override {
    if (isCutShort(path)) return std::make_error_code(std::errc::invalid_argument);
    const Fault fault = faults->nextInTime();
    if (fault == Fault::fails) return std::make_error_code(failure);
    if (fault == Fault::absent) return std::make_error_code(std::errc::no_such_file_or_directory);
    return std::unique_ptr<AppendFile>(std::make_unique<File>(*this, path));
  }

  /// Returns when `count` appends have ended since the beginning, failed ones included.
  void waitForAppends(std::size_t count) {
    std::unique_lock lock(mutex_);
    changed_.wait(lock, [&] { return appends_ >= count; });
  }

  /// How many appends have ended.
  [[nodiscard]] std::size_t appends() const {
    const std::lock_guard lock(mutex_);
    return appends_;
  }

  /// What the file at `path` holds.
  [[nodiscard]] std::string text(const std::string& path) const {
    const std::lock_guard lock(mutex_);
    const auto found = texts_.find(path);
    return found == texts_.end() ? std::string() : found->second;
  }

 private:
  class File final : public AppendFile {
   public:
    File(FakeAppendFiles& files, std::string path) : files_(files), path_(std::move(path)) {}
    [[nodiscard]] std::error_code append(std::string_view bytes) override {
      return files_.append(path_, bytes);
    }

   private:
    FakeAppendFiles& files_;
    const std::string path_;
  };

  std::error_code append(const std::string& path, std::string_view bytes) {
    const Fault fault = faults->nextInTime();
    const std::lock_guard lock(mutex_);
    ++appends_;
    changed_.notify_all();
    if (fault == Fault::fails) return std::make_error_code(failure);
    if (fault == Fault::absent) return std::make_error_code(std::errc::no_such_device);
    texts_[path] += bytes;
    return {};
  }

  mutable std::mutex mutex_;  ///< Owns all below.
  std::condition_variable changed_;
  std::map<std::string, std::string> texts_;
  std::size_t appends_ = 0;
};

}  // namespace Varnel::Platform::Testing
