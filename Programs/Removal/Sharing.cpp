// SPDX-License-Identifier: MIT
#include <Removal/Sharing.h>

#include <algorithm>
#include <optional>
#include <utility>

#include <Removal/DiskPlace.h>
#include <Removal/OpenedFile.h>
#include <Scan/Loss.h>
#include <Varnel/DiskAccess/DiskAccessManager.h>

namespace Orvane {
namespace {

using Outcome = SharingStep::Outcome;

/// A multiple of every block length, so that all parts but a file's last can be shared.
constexpr std::uint64_t maxPart = std::uint64_t{16} << 20;

bool isAsReported(const FileStatus& status, const ReportFile& file, std::uint64_t size) {
  // Wraps around as the time in the status does.
  const auto modifiedAt = static_cast<std::uint64_t>(file.modified) * 1'000'000'000 +
                          static_cast<std::uint64_t>(file.nanoseconds);
  return status.identity.inode == file.inode && status.size == size &&
         status.modifiedAt == static_cast<std::int64_t>(modifiedAt);
}

Outcome outcomeOf(std::error_code error, bool isOnOneDevice) {
  if (error == std::errc::cross_device_link) return Outcome::onOtherFileSystem;
  // The file system that cannot may be the source's.
  if (error == std::errc::not_supported || error == std::errc::operation_not_supported ||
      error == std::errc::inappropriate_io_control_operation ||
      error == std::errc::function_not_supported)
    return isOnOneDevice ? Outcome::unsupported : Outcome::onOtherFileSystem;
  if (error == std::errc::read_only_file_system) return Outcome::readOnly;
  if (error == std::errc::operation_not_permitted || error == std::errc::permission_denied)
    return Outcome::notPermitted;
  return Outcome::failed;
}

}  // namespace

Sharing::Sharing(Ports ports, const Report& report, Mode mode, const std::atomic<bool>& shouldStop)
    : ports_(ports), report_(report), mode_(mode), shouldStop_(shouldStop) {
  for (std::size_t group = 0; group < report.groups.size(); ++group) {
    const std::vector<ReportFile>& files = report.groups[group].files;
    for (const bool areReferences : {true, false})
      for (std::size_t file = 0; file < files.size(); ++file)
        if (files[file].isReference == areReferences)
          steps_.push_back({.group = group, .file = file});
  }
}

const ReportFile& Sharing::fileOf(const SharingStep& step) const {
  return report_.groups[step.group].files[step.file];
}

const std::string& Sharing::pathOf(const SharingStep& step) const {
  return fileOf(step).path;
}

std::uint64_t Sharing::sizeOf(const SharingStep& step) const {
  return report_.groups[step.group].size;
}

const SharingStep* Sharing::next(const std::function<void()>& didShare) {
  if (shouldStop_ || nextStep_ == steps_.size()) return nullptr;
  SharingStep& step = steps_[nextStep_];
  if (nextStep_ == 0 || steps_[nextStep_ - 1].group != step.group) sources_.clear();
  ++nextStep_;
  Source file = open(step);
  if (!file.file) return &step;
  step.outcome = Outcome::source;
  bool isNewDevice = true;
  for (const Source& source : sources_) {
    isNewDevice = isNewDevice && source.status.identity.device != file.status.identity.device;
    if (fileOf(step).isReference) continue;
    share(step, file, source, didShare);
    if (step.outcome != Outcome::onOtherFileSystem) return &step;
  }
  if (isNewDevice) sources_.push_back(std::move(file));
  return &step;
}

Sharing::Source Sharing::open(SharingStep& step) {
  const std::string& path = pathOf(step);
  const auto lost = [&](std::error_code error) {
    const bool isUnreadable = Loss::because(error).kind == Loss::Kind::unreadable;
    step.outcome = isUnreadable ? Outcome::unreadable : Outcome::changed;
    step.code = error;
    return Source{};
  };
  step.outcome = Outcome::noAccess;
  const auto place = placeOnDiskOf(path, ports_.disks);
  if (!place) return {};
  step.outcome = Outcome::changed;
  auto file = openFile(path, ports_.fileSystem);
  if (!file) return lost(file.error());
  const auto status = (*file)->status();
  if (!status) return lost(status.error());
  if (!isAsReported(*status, fileOf(step), sizeOf(step))) return {};
  return {.path = &path, .file = std::move(*file), .status = *status};
}

Sharing::Held Sharing::heldBy(const Source& source) {
  const auto place = placeOnDiskOf(*source.path, ports_.disks);
  if (!place) return {};
  Held held{.extents = source.file->sharedExtents()};
  const auto status = source.file->status();
  if (!status || !held.extents) return held;
  const std::uint64_t taken = std::min(status->size, status->allocated);
  held.ownBytes = taken - std::min(taken, held.extents->bytes + held.extents->inlineBytes);
  return held;
}

void Sharing::share(SharingStep& step, const Source& file, const Source& source,
                    const std::function<void()>& didShare) {
  const Held before = heldBy(file);
  const auto other = heldBy(source).extents;
  step.outcome = Outcome::alreadyShared;
  if (file.status.identity == source.status.identity) return;
  if (before.ownBytes == 0u) {
    if (other && before.extents->bytes > 0 && before.extents->place == other->place) return;
    step.outcome = Outcome::withoutExtents;
    if (before.extents->bytes == 0) return;
  }
  shareParts(step, file, source, didShare);
  if (!before.ownBytes) return;
  if (step.outcome == Outcome::planned) {
    step.freedBytes = *before.ownBytes;
    return;
  }
  const Held after = heldBy(file);
  if (!after.ownBytes) return;
  // What was not written yet may have got its place only now.
  if (step.outcome == Outcome::shared && after.extents->bytes == 0) {
    step.outcome = Outcome::withoutExtents;
  } else {
    step.freedBytes = *before.ownBytes - std::min(*before.ownBytes, *after.ownBytes);
  }
}

void Sharing::shareParts(SharingStep& step, const Source& file, const Source& source,
                         const std::function<void()>& didShare) {
  const bool isTrial = mode_ == Mode::trial;
  const std::uint64_t size = isTrial ? 0 : sizeOf(step);
  std::uint64_t offset = 0;
  do {
    step.outcome = shouldStop_ ? Outcome::stopped : Outcome::noAccess;
    if (shouldStop_) return;
    const auto placeOfSource = placeOnDiskOf(*source.path, ports_.disks);
    const auto place = placeOnDiskOf(*file.path, ports_.disks);
    if (!placeOfSource || !place) return;
    const std::uint64_t length = std::min(maxPart, size - offset);
    const auto shared = file.file->share(*source.file, offset, length);
    const bool isDifferent = shared && !*shared;
    if (!shared || isDifferent || (**shared == 0 && length > 0)) {
      const auto status = file.file->status();
      const auto statusOfSource = source.file->status();
      if (!status || !statusOfSource || !status->hasContentOf(file.status) ||
          !statusOfSource->hasContentOf(source.status)) {
        step.outcome = Outcome::changed;
      } else if (isDifferent) {
        step.outcome = Outcome::different;
      } else {
        const auto error = shared ? std::error_code() : shared.error();
        step.outcome =
            outcomeOf(error, file.status.identity.device == source.status.identity.device);
        if (step.outcome == Outcome::failed) step.code = error;
      }
      return;
    }
    offset += **shared;
    comparedBytes_ += **shared;
    didShare();
  } while (offset < size);
  step.outcome = isTrial ? Outcome::planned : Outcome::shared;
}

SharingTotals Sharing::totals() const {
  SharingTotals totals;
  bool isUnsupported = false, isElse = false;
  for (const SharingStep& step : steps_) {
    totals.freedBytes += step.freedBytes;
    switch (step.outcome) {
      case Outcome::source:
        continue;
      case Outcome::withoutExtents:
        break;
      case Outcome::planned:
        ++totals.planned;
        break;
      case Outcome::shared:
        ++totals.shared;
        break;
      case Outcome::alreadyShared:
        ++totals.alreadyShared;
        break;
      default:
        ++totals.notShared;
        if (step.outcome == Outcome::unsupported) isUnsupported = true;
        if (step.outcome == Outcome::unsupported || step.outcome == Outcome::onOtherFileSystem)
          continue;
    }
    isElse = true;
  }
  totals.isSupported = isElse || !isUnsupported;
  return totals;
}

}  // namespace Orvane
