// SPDX-License-Identifier: MIT
#include <varnel-notifier/ProgramFile.h>

#include <sys/stat.h>

#include <Varnel/Platform/Ports/Clock.h>
#include <Varnel/Platform/Ports/WallClockTimer.h>

namespace Varnel {

// The kernel knows the file that runs, whatever lies in its place by now.
ProgramFile::ProgramFile(const std::filesystem::path& path, const Platform::Clock& clock,
                         std::unique_ptr<Platform::WallClockTimer> timer)
    : path_(path),
      clock_(clock),
      timer_(std::move(timer)),
      own_(identityOf("/proc/self/exe")),
      watch_(path.parent_path(), path.filename(), [] {}) {}

ProgramFile::~ProgramFile() = default;

ProgramFile::State ProgramFile::look() {
  const Identity present = identityOf(path_.c_str());
  if (!present) return isMissingForLong() ? State::gone : State::inPlace;
  missingSince_.reset();
  timer_->disarm();
  if (!own_ || present == own_) return State::inPlace;
  if (pause_.isOver(clock_.now())) return State::replaced;
  timer_->arm(pause_.end());
  return State::inPlace;
}

void ProgramFile::postpone() {
  pause_.failed(clock_.now());
}

// A time from the future was taken before the clock was set back.
bool ProgramFile::isMissingForLong() {
  const Platform::Date now = clock_.now();
  if (!missingSince_ || now < *missingSince_) missingSince_ = now;
  timer_->arm(*missingSince_ + maxAbsence);
  return now >= *missingSince_ + maxAbsence;
}

ProgramFile::Identity ProgramFile::identityOf(const char* path) {
  struct stat status {};
  if (::stat(path, &status) != 0) return std::nullopt;
  return std::pair(status.st_dev, status.st_ino);
}

}  // namespace Varnel
