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

namespace Varnel::Platform::Testing {

/// Files in memory whose disk fails, or hangs, when the test says so. Any thread; it must outlive
/// the files that it opened.
///
///     FakeAppendFiles files;
///     files.failNextAppends(2, std::errc::no_space_on_device);
///     …
///     files.waitForAppends(3);
///     EXPECT_EQ(files.text("/log"), "what the third one wrote");
class FakeAppendFiles final : public AppendFiles {
 public:
  [[nodiscard]] Result<std::unique_ptr<AppendFile>, std::error_code> open(
      const std::string& path) override {
    const std::lock_guard lock(mutex_);
    if (openFailure_ != std::errc()) return std::make_error_code(openFailure_);
    return std::unique_ptr<AppendFile>(std::make_unique<File>(*this, path));
  }

  /// From now on no file can be opened; with `std::errc()`, files can be opened again. Open files
  /// stay open.
  void failOpening(std::errc failure) {
    const std::lock_guard lock(mutex_);
    openFailure_ = failure;
  }

  /// The next `count` appends write nothing and answer with this error.
  void failNextAppends(std::size_t count, std::errc failure) {
    const std::lock_guard lock(mutex_);
    failingAppends_ = count;
    appendFailure_ = failure;
  }

  /// Makes appends wait, as on a disk that has gone to sleep, until `release`.
  void hold() { setHeld(true); }
  void release() { setHeld(false); }

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

  void setHeld(bool isHeld) {
    const std::lock_guard lock(mutex_);
    isHeld_ = isHeld;
    changed_.notify_all();
  }

  std::error_code append(const std::string& path, std::string_view bytes) {
    std::unique_lock lock(mutex_);
    changed_.wait(lock, [&] { return !isHeld_; });
    ++appends_;
    changed_.notify_all();
    if (failingAppends_ > 0) {
      --failingAppends_;
      return std::make_error_code(appendFailure_);
    }
    texts_[path] += bytes;
    return {};
  }

  mutable std::mutex mutex_;  ///< Owns everything below.
  std::condition_variable changed_;
  std::map<std::string, std::string> texts_;
  std::errc openFailure_{};
  std::errc appendFailure_{};
  std::size_t failingAppends_ = 0;
  std::size_t appends_ = 0;
  bool isHeld_ = false;
};

}  // namespace Varnel::Platform::Testing
