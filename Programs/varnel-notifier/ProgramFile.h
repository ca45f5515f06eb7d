// SPDX-License-Identifier: MIT
#pragma once

#include <sys/types.h>

#include <chrono>
#include <filesystem>
#include <memory>
#include <optional>
#include <utility>

#include <Varnel/Platform/Linux/MainLoop/FileWatch.h>
#include <Varnel/Platform/Values/Date.h>
#include <Varnel/Platform/Values/GrowingPause.h>

namespace Varnel {

namespace Platform {
class Clock;
class WallClockTimer;
}  // namespace Platform

/// The file that this program was started from: an upgrade replaces it, and a removal takes it
/// away. The main loop turns when either has happened. Main thread only.
class ProgramFile final {
 public:
  /// What is missing for less is being put back.
  static constexpr std::chrono::seconds maxAbsence{5};

  enum class State { inPlace, replaced, gone };

  /// The clock outlives this.
  ProgramFile(const std::filesystem::path& path, const Platform::Clock& clock,
              std::unique_ptr<Platform::WallClockTimer> timer);
  ~ProgramFile();
  ProgramFile(const ProgramFile&) = delete;
  ProgramFile& operator=(const ProgramFile&) = delete;

  [[nodiscard]] State look();

  /// What lies in its place could not be started, as while it is being written: it replaces nothing
  /// yet, for a pause that grows each time.
  void postpone();

 private:
  using Identity = std::optional<std::pair<dev_t, ino_t>>;

  [[nodiscard]] static Identity identityOf(const char* path);
  [[nodiscard]] bool isMissingForLong();

  const std::filesystem::path path_;
  const Platform::Clock& clock_;
  const std::unique_ptr<Platform::WallClockTimer> timer_;  ///< Ends a pause or an absence.
  const Identity own_;
  std::optional<Platform::Date> missingSince_;
  Platform::GrowingPause pause_{std::chrono::seconds(1), std::chrono::minutes(5)};
  const Platform::Linux::FileWatch watch_;
};

}  // namespace Varnel
