// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <system_error>

#include <Varnel/Platform/Ports/PrivateFiles.h>
#include <Varnel/Platform/Testing/FaultPlan.h>

namespace Varnel::Platform::Testing {

/// Another's private files, whose calls go wrong by plan. Any thread; the other one outlives it.
///
///     FaultyPrivateFiles files(systemPorts().privateFiles);
///     files.faults->plan(Fault::fails, 2);
class FaultyPrivateFiles final : public PrivateFiles {
 public:
  explicit FaultyPrivateFiles(PrivateFiles& files) : files_(files) {}

  /// An absent file has no identity, and an absent lock is in somebody else's hands.
  std::shared_ptr<FaultPlan> faults = std::make_shared<FaultPlan>();
  /// Called before a call goes wrong: a test may end the process there.
  std::function<void()> whenStruck = [] {};

  [[nodiscard]] std::optional<PlatformError> makeFolders(const std::string& path) override {
    if (const auto code = failure()) return PlatformError(code);
    return files_.makeFolders(path);
  }
  [[nodiscard]] Result<std::string> prepare(const std::string& path) override {
    if (const auto code = failure()) return PlatformError(code);
    return files_.prepare(path);
  }
  [[nodiscard]] std::error_code protect(const std::string& path) override {
    const auto code = failure();
    return code ? code : files_.protect(path);
  }
  [[nodiscard]] std::optional<FileIdentity> identity(const std::string& path) override {
    return failure() ? std::nullopt : files_.identity(path);
  }
  [[nodiscard]] Result<std::unique_ptr<FileLock>> tryLock(const std::string& path) override {
    const Fault fault = next();
    if (fault == Fault::absent) return std::unique_ptr<FileLock>();
    if (fault == Fault::fails) return PlatformError(std::make_error_code(std::errc::io_error));
    return files_.tryLock(path);
  }
  [[nodiscard]] std::error_code rename(const std::string& from, const std::string& to) override {
    const auto code = failure();
    return code ? code : files_.rename(from, to);
  }
  [[nodiscard]] std::error_code remove(const std::string& path) override {
    const auto code = failure();
    return code ? code : files_.remove(path);
  }

 private:
  Fault next() const {
    const Fault fault = faults->nextInTime();
    if (fault != Fault::none) whenStruck();
    return fault;
  }

  std::error_code failure() const {
    const Fault fault = next();
    if (fault == Fault::none) return {};
    return std::make_error_code(fault == Fault::absent ? std::errc::no_such_file_or_directory
                                                       : std::errc::io_error);
  }

  PrivateFiles& files_;
};

}  // namespace Varnel::Platform::Testing
