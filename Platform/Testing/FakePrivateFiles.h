// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <memory>
#include <string>
#include <system_error>
#include <utility>

#include <Varnel/Platform/Ports/PrivateFiles.h>
#include <Varnel/Platform/Testing/FaultPlan.h>

namespace Varnel::Platform::Testing {

/// Files of another `PrivateFiles`, usually the system's, whose calls fail by plan.
///
///     FakePrivateFiles files(systemPorts().privateFiles);
///     files.faults->plan(Fault::fails, 4);             // with `failure`
///     files.whenStruck = [] { ::raise(SIGKILL); };     // or the process ends there
///
/// Where the fault is `absent`, a file is not found, and a lock is somebody else's. Any thread; to
/// be set up before it is used.
class FakePrivateFiles final : public PrivateFiles {
 public:
  explicit FakePrivateFiles(PrivateFiles& files) : files_(files) {}

  [[nodiscard]] Result<std::string> prepare(const std::string& path) override {
    if (isStruck()) return PlatformError(error());
    return files_.prepare(path);
  }
  [[nodiscard]] std::error_code protect(const std::string& path) override {
    return isStruck() ? error() : files_.protect(path);
  }
  [[nodiscard]] std::optional<FileIdentity> identity(const std::string& path) override {
    return isStruck() ? std::nullopt : files_.identity(path);
  }
  [[nodiscard]] std::unique_ptr<HeldFile> hold(const std::string& path) override {
    return isStruck() ? nullptr : files_.hold(path);
  }
  [[nodiscard]] Result<std::unique_ptr<FileLock>> tryLock(const std::string& path) override {
    const Fault fault = next();
    if (fault == Fault::fails) return PlatformError(error());
    if (fault == Fault::absent) return std::unique_ptr<FileLock>();
    return files_.tryLock(path);
  }
  [[nodiscard]] std::error_code rename(const std::string& from, const std::string& to) override {
    return isStruck() ? error() : files_.rename(from, to);
  }
  [[nodiscard]] std::error_code remove(const std::string& path) override {
    return isStruck() ? error() : files_.remove(path);
  }

  std::shared_ptr<FaultPlan> faults = std::make_shared<FaultPlan>();
  std::errc failure = std::errc::io_error;
  std::function<void()> whenStruck = [] {};

 private:
  [[nodiscard]] std::error_code error() const { return std::make_error_code(failure); }

  Fault next() {
    const Fault fault = faults->nextInTime();
    if (fault != Fault::none) whenStruck();
    return fault;
  }
  bool isStruck() { return next() != Fault::none; }

  PrivateFiles& files_;
};

}  // namespace Varnel::Platform::Testing
