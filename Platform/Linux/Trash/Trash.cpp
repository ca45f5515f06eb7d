// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Ports/Trash.h>

#include <sys/stat.h>

#include <filesystem>
#include <utility>

#include <Varnel/Platform/Linux/Adapters.h>
#include <Varnel/Platform/Linux/Trash/HeldFolder.h>
#include <Varnel/Platform/Linux/Trash/TrashFolder.h>
#include <Varnel/Platform/Linux/Trash/TrashInfo.h>
#include <Varnel/Platform/POSIX/UserFolders.h>
#include <Varnel/Platform/Ports/Clock.h>
#include <Varnel/Platform/Ports/PrivateFiles.h>
#include <Varnel/Platform/Ports/TimeZones.h>
#include <Varnel/Platform/Values/SystemText.h>

// A file is moved in one step, which replaces nothing, between its info file's coming and going.
// So wherever the process ends, the file is in its place, perhaps with a name taken for it in the
// trash, or in the trash with its info file. What is checked before that step is checked again
// after it, and undone when another program came between.
namespace Varnel::Platform::Linux {
namespace {

using Reason = TrashError::Reason;

constexpr unsigned maxAttempts = 64;

TrashError failed(std::error_code code) {
  return {.reason = Reason::failed, .code = code};
}

TrashError noTrash(std::error_code code) {
  return {.reason = Reason::noTrash, .code = code};
}

// The links in it are the user's own.
std::string homePath() {
  const auto path = POSIX::userDataFolder() / "Trash";
  std::error_code unreadable;
  const auto resolved = std::filesystem::weakly_canonical(path, unreadable);
  return unreadable ? path : resolved;
}

bool isSameOverRestarts(const FileState& a, const FileState& b) {
  return a.size == b.size && a.modified == b.modified && a.nanoseconds == b.nanoseconds;
}

bool exists(int folder, const std::string& name) {
  struct stat facts {};
  return ::fstatat(folder, name.c_str(), &facts, AT_SYMLINK_NOFOLLOW) == 0 || errno != ENOENT;
}

// A name in a folder that is held.
struct Place {
  HeldFolder folder;
  std::string name;

  [[nodiscard]] std::optional<FileState> state() const {
    return stateAt(folder.folder.get(), name);
  }
};

Result<Place, std::error_code> placeOf(const std::string& path, Missing missing) {
  const std::size_t slash = path.rfind('/');
  if (slash == std::string::npos) return std::make_error_code(std::errc::invalid_argument);
  std::string name = path.substr(slash + 1);
  if (name.empty() || name == "." || name == "..")
    return std::make_error_code(std::errc::invalid_argument);
  auto folder = HeldFolder::open(path.substr(0, slash + 1), missing);
  if (!folder) return folder.error();
  return Place{.folder = std::move(*folder), .name = std::move(name)};
}

bool isMissing(std::error_code code) {
  return code == std::errc::no_such_file_or_directory || code == std::errc::not_a_directory;
}

// The place of a file that is there: a link on the way is as good as none.
Result<Place, TrashError> presentPlace(const std::string& path) {
  if (isCutShort(path)) return failed(std::make_error_code(std::errc::invalid_argument));
  auto place = placeOf(path, Missing::fails);
  if (place) return std::move(*place);
  if (isMissing(place.error())) return TrashError{.reason = Reason::changed, .code = place.error()};
  return failed(place.error());
}

// What is in the trash stays as it is: its first place would be forgotten.
Result<Place, TrashError> placeOutsideTrash(const std::string& path) {
  auto place = presentPlace(path);
  if (place && TrashFolder::isInOne(place->folder.path + "/", homePath())) return noTrash({});
  return place;
}

// What the step itself says: files of other mounts, and file systems that may replace, have no
// trash here.
TrashError whyNotMoved(std::error_code code) {
  if (code == std::errc::no_such_file_or_directory)
    return {.reason = Reason::changed, .code = code};
  if (code == std::errc::cross_device_link || code == std::errc::invalid_argument ||
      code == std::errc::function_not_supported)
    return noTrash(code);
  return failed(code);
}

class DesktopTrash final : public Trash {
 public:
  DesktopTrash(PrivateFiles& files, const Clock& clock, const TimeZones& timeZones)
      : files_(files), clock_(clock), timeZones_(timeZones) {}

  Result<FileState, TrashError> state(const std::string& path) override {
    const auto place = presentPlace(path);
    if (!place) return place.error();
    if (const auto state = place->state()) return *state;
    return TrashError{.reason = Reason::changed};
  }

  bool isInTrash(const std::string& path) override {
    return TrashFolder::isInOne(path, homePath());
  }

  Result<std::string, TrashError> folderFor(const std::string& path) override {
    const auto place = placeOutsideTrash(path);
    if (!place) return place.error();
    auto trash = homeTrash(*place);
    if (!trash) trash = volumeTrash(*place);
    if (!trash) return trash.error();
    return trash->path();
  }

  Result<TrashedFile, TrashError> move(const std::string& path, const FileState& expected,
                                       const Ready& ready) override {
    const auto place = placeOutsideTrash(path);
    if (!place) return place.error();
    if (place->state() != expected) return TrashError{.reason = Reason::changed};
    if (const auto trash = homeTrash(*place)) {
      // Even within one mount there may be borders: parts with a quota, subvolumes.
      auto moved = moveInto(*trash, *place, expected, ready);
      if (moved || moved.error().code != std::errc::cross_device_link) return moved;
    }
    const auto trash = volumeTrash(*place);
    if (!trash) return trash.error();
    return moveInto(*trash, *place, expected, ready);
  }

  std::optional<TrashError> restore(const TrashedFile& file, Folders folders) override;
  Result<std::vector<TrashedFile>, TrashError> contents(const std::string& folder) override;

 private:
  Result<TrashFolder, TrashError> homeTrash(const Place& place);
  static Result<TrashFolder, TrashError> volumeTrash(const Place& place);
  Result<TrashedFile, TrashError> moveInto(const TrashFolder& trash, const Place& place,
                                           const FileState& expected, const Ready& ready);
  static std::optional<TrashError> moveAs(const TrashedFile& planned, const TrashFolder& trash,
                                          const Place& place, const InfoFile& info,
                                          const Ready& ready);
  Date userDate() const {
    const Date now = clock_.now();
    return now + timeZones_.zone(timeZones_.localIdentifier())->offsetAt(now).fromUTC;
  }

  PrivateFiles& files_;
  const Clock& clock_;
  const TimeZones& timeZones_;
};

Result<TrashFolder, TrashError> DesktopTrash::homeTrash(const Place& place) {
  if (files_.makeFolders(homePath()))
    return noTrash(std::make_error_code(std::errc::permission_denied));
  auto trash = TrashFolder::atHome(homePath(), place.folder);
  if (!trash) return noTrash(trash.error());
  return std::move(*trash);
}

Result<TrashFolder, TrashError> DesktopTrash::volumeTrash(const Place& place) {
  auto trash = TrashFolder::ofVolume(place.folder);
  if (!trash) return noTrash(trash.error());
  return std::move(*trash);
}

Result<TrashedFile, TrashError> DesktopTrash::moveInto(const TrashFolder& trash, const Place& place,
                                                       const FileState& expected,
                                                       const Ready& ready) {
  const std::string path = place.folder.path + "/" + place.name;
  std::error_code taken;
  for (unsigned attempt = 0; attempt < maxAttempts; ++attempt) {
    const TrashedFile planned{.folder = trash.path(),
                              .name = nameInTrash(place.name, attempt, trash.maxName()),
                              .path = path,
                              .state = expected};
    if (exists(trash.files(), planned.name)) continue;
    const auto info = trash.reserve(planned.name, path, userDate());
    if (!info) {
      taken = info.error();
      if (taken == std::errc::file_exists) continue;
      return failed(taken);
    }
    const auto error = moveAs(planned, trash, place, *info, ready);
    if (!error) return planned;
    if (error->reason == Reason::misplaced) return *error;
    info->remove();
    taken = error->code;
    if (taken != std::errc::file_exists) return *error;
  }
  return failed(std::make_error_code(std::errc::file_exists));
}

// With the info file on the disk.
std::optional<TrashError> DesktopTrash::moveAs(const TrashedFile& planned, const TrashFolder& trash,
                                               const Place& place, const InfoFile& info,
                                               const Ready& ready) {
  if (!ready(planned)) return TrashError{.reason = Reason::declined};
  if (place.state() != planned.state) return TrashError{.reason = Reason::changed};
  const int from = place.folder.folder.get();
  if (const auto code = moveAside(from, place.name, trash.files(), planned.name))
    return whyNotMoved(code);

  const auto moved = stateAt(trash.files(), planned.name);
  if (moved == planned.state && info.isThere()) return std::nullopt;
  const auto code = moveAside(trash.files(), planned.name, from, place.name);
  if (!code && moved != planned.state) return TrashError{.reason = Reason::changed};
  // Another program empties the trash right now.
  if (!code) return failed(std::make_error_code(std::errc::resource_unavailable_try_again));
  if (!exists(trash.files(), planned.name))
    return TrashError{.reason = Reason::emptied, .code = code};
  // Something new is in its place. So it stays, with what tells where it was.
  if (!info.isThere()) static_cast<void>(trash.reserve(planned.name, planned.path, {}));
  TrashedFile misplaced = planned;
  misplaced.state = moved.value_or(FileState());
  return TrashError{.reason = Reason::misplaced, .code = code, .file = std::move(misplaced)};
}

std::optional<TrashError> DesktopTrash::restore(const TrashedFile& file, Folders folders) {
  const auto because = [](Reason reason, std::error_code code = {}) {
    return TrashError{.reason = reason, .code = code};
  };
  if (isCutShort(file.folder) || isCutShort(file.name) || isCutShort(file.path) ||
      file.name.empty() || file.name == "." || file.name == ".." ||
      file.name.find('/') != std::string::npos)
    return failed(std::make_error_code(std::errc::invalid_argument));
  const auto trash = TrashFolder::open(file.folder);
  if (!trash) {
    // Many people empty a trash by removing all of it.
    const bool isGone = trash.error() == std::errc::no_such_file_or_directory &&
                        TrashFolder::isDiskThere(file.folder, homePath());
    return isGone ? because(Reason::emptied) : noTrash(trash.error());
  }
  const auto info = trash->info(file.name);
  if (!info || trash->pathIn(*info) != file.path) return because(Reason::emptied);
  const auto state = stateAt(trash->files(), file.name);
  if (!state || !isSameOverRestarts(*state, file.state)) return because(Reason::emptied);

  const bool recreates = folders == Folders::recreate;
  const auto place = placeOf(file.path, recreates ? Missing::isMade : Missing::fails);
  if (!place)
    return because(isMissing(place.error()) ? Reason::folderMissing : Reason::failed,
                   place.error());
  const int to = place->folder.folder.get();
  if (const auto code = moveAside(trash->files(), file.name, to, place->name)) {
    if (code == std::errc::file_exists) return because(Reason::occupied, code);
    return because(isMissing(code) ? Reason::emptied : Reason::failed, code);
  }
  if (place->state() == state) {
    info->remove();
    return std::nullopt;
  }
  // Another file took its name in the trash right before.
  const auto code = moveAside(to, place->name, trash->files(), file.name);
  if (!code) return because(Reason::emptied);
  return TrashError{.reason = Reason::misplaced, .code = code, .file = file};
}

Result<std::vector<TrashedFile>, TrashError> DesktopTrash::contents(const std::string& folder) {
  std::vector<TrashedFile> files;
  const auto trash = TrashFolder::open(folder);
  if (!trash && isMissing(trash.error())) return files;
  if (!trash) return failed(trash.error());
  const auto names = trash->names();
  if (!names) return failed(names.error());
  for (const std::string& name : *names) {
    const auto state = stateAt(trash->files(), name);
    const auto info = trash->info(name);
    if (!state || !info) continue;
    if (auto path = trash->pathIn(*info))
      files.push_back({.folder = folder, .name = name, .path = std::move(*path), .state = *state});
  }
  return files;
}

}  // namespace

std::unique_ptr<Trash> makeTrash(PrivateFiles& files, const Clock& clock,
                                 const TimeZones& timeZones) {
  return std::make_unique<DesktopTrash>(files, clock, timeZones);
}

}  // namespace Varnel::Platform::Linux
