// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Linux/Trash/TrashFolder.h>

#include <dirent.h>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <memory>
#include <utility>

#include <Varnel/Platform/Linux/Trash/TrashInfo.h>
#include <Varnel/Platform/POSIX/LastError.h>

namespace Varnel::Platform::Linux {
namespace {

using POSIX::FileDescriptor;
using POSIX::lastError;

constexpr std::string_view sharedName = ".Trash";
constexpr std::string_view ownPrefix = ".Trash-";
// Of volumes, of other users, and of the other systems that a volume comes from.
constexpr std::string_view namesOfTrashes[] = {
    "/.Trash-",   "/.Trash/",       "/.local/share/Trash/",
    "/.Trashes/", "/$RECYCLE.BIN/", "/$Recycle.Bin/"};
constexpr std::size_t maxInfoSize = 64u << 10;
constexpr long maxName = 255;

bool isSameFile(const struct stat& a, const struct stat& b) {
  return a.st_dev == b.st_dev && a.st_ino == b.st_ino;
}

std::error_code writeAll(int file, std::string_view bytes) {
  while (!bytes.empty()) {
    const ssize_t written = ::write(file, bytes.data(), bytes.size());
    if (written < 0 && errno == EINTR) continue;
    if (written < 0) return lastError();
    bytes.remove_prefix(static_cast<std::size_t>(written));
  }
  return ::fsync(file) == 0 || errno == EINVAL ? std::error_code() : lastError();
}

// The volume's folder, by the path of a trash that is no home's.
std::optional<std::string> volumeOf(const std::string& trash) {
  const std::size_t slash = trash.rfind('/');
  const std::string above = trash.substr(0, slash);
  if (trash.compare(slash + 1, ownPrefix.size(), ownPrefix) == 0) return above;
  const std::string shared = "/" + std::string(sharedName);
  if (above.ends_with(shared)) return above.substr(0, above.size() - shared.size());
  return std::nullopt;
}

// The administrator's folder for the trashes of all: nobody may take another's away.
FileDescriptor sharedTrash(int volume) {
  FileDescriptor shared(::openat(volume, std::string(sharedName).c_str(),
                                 O_PATH | O_DIRECTORY | O_NOFOLLOW | O_CLOEXEC));
  struct stat facts {};
  if (!shared || ::fstat(shared.get(), &facts) != 0 || (facts.st_mode & S_ISVTX) == 0) return {};
  return shared;
}

}  // namespace

bool InfoFile::isThere() const {
  struct stat mine {};
  struct stat there {};
  return ::fstat(file.get(), &mine) == 0 &&
         ::fstatat(folder, name.c_str(), &there, AT_SYMLINK_NOFOLLOW) == 0 &&
         isSameFile(mine, there);
}

void InfoFile::remove() const {
  if (isThere()) ::unlinkat(folder, name.c_str(), 0);
}

std::optional<std::string> InfoFile::text() const {
  std::string bytes;
  for (std::array<char, 4096> buffer{}; bytes.size() <= maxInfoSize;) {
    const ssize_t count = ::read(file.get(), buffer.data(), buffer.size());
    if (count < 0 && errno == EINTR) continue;
    if (count < 0) return std::nullopt;
    if (count == 0) return bytes;
    bytes.append(buffer.data(), static_cast<std::size_t>(count));
  }
  return std::nullopt;
}

TrashFolder::TrashFolder(std::string path, std::optional<std::string> volume, FileDescriptor files,
                         FileDescriptor info)
    : path_(std::move(path)),
      volume_(std::move(volume)),
      files_(std::move(files)),
      info_(std::move(info)) {}

Result<TrashFolder, std::error_code> TrashFolder::openIn(int folder, std::string path,
                                                         Missing missing) {
  auto files = openOwn(folder, "files", missing);
  if (!files) return files.error();
  auto info = openOwn(folder, "info", missing);
  if (!info) return info.error();
  auto volume = volumeOf(path);
  return TrashFolder(std::move(path), std::move(volume), std::move(*files), std::move(*info));
}

Result<TrashFolder, std::error_code> TrashFolder::open(const std::string& path) {
  const auto held = HeldFolder::open(path, Missing::fails);
  if (!held) return held.error();
  return openIn(held->folder.get(), path, Missing::fails);
}

bool TrashFolder::isDiskThere(const std::string& path, const std::string& home) {
  const auto volume = volumeOf(path);
  if (!volume && path != home) return false;
  const auto above = HeldFolder::open(volume ? *volume + "/" : path.substr(0, path.rfind('/') + 1),
                                      Missing::fails);
  return above && (!volume || above->path == above->volumePath);
}

Result<TrashFolder, std::error_code> TrashFolder::atHome(const std::string& path,
                                                         const HeldFolder& folder) {
  const auto held = HeldFolder::open(path, Missing::fails);
  if (!held) return held.error();
  if (held->mount != folder.mount) return std::make_error_code(std::errc::cross_device_link);
  return openIn(held->folder.get(), path, Missing::isMade);
}

Result<TrashFolder, std::error_code> TrashFolder::ofVolume(const HeldFolder& folder) {
  const auto openOwnIn = [](int parent, const std::string& name,
                            const std::string& path) -> Result<TrashFolder, std::error_code> {
    const auto own = openOwn(parent, name, Missing::isMade);
    if (!own) return own.error();
    return openIn(own->get(), path + "/" + name, Missing::isMade);
  };
  const std::string user = std::to_string(::geteuid());
  if (const auto shared = sharedTrash(folder.volume.get())) {
    auto trash = openOwnIn(shared.get(), user, folder.volumePath + "/" + std::string(sharedName));
    if (trash) return trash;
  }
  return openOwnIn(folder.volume.get(), std::string(ownPrefix) + user, folder.volumePath);
}

bool TrashFolder::isInOne(std::string_view path, const std::string& home) {
  const std::string_view folder = path.substr(0, path.rfind('/') + 1);
  return folder.starts_with(home + "/") ||
         std::any_of(std::begin(namesOfTrashes), std::end(namesOfTrashes),
                     [&](std::string_view name) { return folder.find(name) != folder.npos; });
}

// Some file systems count characters, and tell how many bytes those could be.
std::size_t TrashFolder::maxName() const {
  const long told = ::fpathconf(files(), _PC_NAME_MAX);
  return static_cast<std::size_t>(told > 0 ? std::min(told, Linux::maxName) : Linux::maxName);
}

Result<InfoFile, std::error_code> TrashFolder::reserve(const std::string& name,
                                                       std::string_view path, Date deleted) const {
  if (volume_) path.remove_prefix(volume_->size() + 1);
  InfoFile made{.folder = info_.get(), .name = name + std::string(trashInfoEnding), .file = {}};
  made.file = FileDescriptor(::openat(made.folder, made.name.c_str(),
                                      O_RDWR | O_CREAT | O_EXCL | O_NOFOLLOW | O_CLOEXEC,
                                      S_IRUSR | S_IWUSR));
  if (!made.file) return lastError();
  std::error_code failure;
  if (::fchmod(made.file.get(), S_IRUSR | S_IWUSR) != 0 && errno != EPERM) failure = lastError();
  if (!failure) failure = writeAll(made.file.get(), trashInfoText(path, deleted));
  // The name must last as well as the bytes.
  if (!failure && ::fsync(made.folder) != 0 && errno != EINVAL) failure = lastError();
  if (!failure) return made;
  made.remove();
  return failure;
}

std::optional<InfoFile> TrashFolder::info(const std::string& name) const {
  InfoFile found{.folder = info_.get(), .name = name + std::string(trashInfoEnding), .file = {}};
  found.file = FileDescriptor(
      ::openat(found.folder, found.name.c_str(), O_RDONLY | O_NOFOLLOW | O_NONBLOCK | O_CLOEXEC));
  struct stat facts {};
  if (!found.file || ::fstat(found.file.get(), &facts) != 0 || !S_ISREG(facts.st_mode))
    return std::nullopt;
  return found;
}

std::optional<std::string> TrashFolder::pathIn(const InfoFile& info) const {
  auto path = pathInTrashInfo(info.text().value_or(std::string()));
  if (path && volume_ && !path->starts_with('/')) path = *volume_ + "/" + *path;
  return path;
}

Result<std::vector<std::string>, std::error_code> TrashFolder::names() const {
  FileDescriptor own(::openat(files(), ".", O_RDONLY | O_DIRECTORY | O_CLOEXEC));
  if (!own) return lastError();
  const std::unique_ptr<DIR, int (*)(DIR*)> folder(::fdopendir(own.get()), &::closedir);
  if (!folder) return lastError();
  static_cast<void>(own.release());  // the folder closes it
  std::vector<std::string> names;
  errno = 0;
  while (const dirent* entry = ::readdir(folder.get()))
    if (const std::string name = entry->d_name; name != "." && name != "..") names.push_back(name);
  if (errno != 0) return lastError();
  std::sort(names.begin(), names.end());
  return names;
}

}  // namespace Varnel::Platform::Linux
