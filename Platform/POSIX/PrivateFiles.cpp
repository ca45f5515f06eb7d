// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Ports/PrivateFiles.h>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <cstdio>
#include <filesystem>

#include <Varnel/Platform/POSIX/Adapters.h>
#include <Varnel/Platform/POSIX/FileDescriptor.h>
#include <Varnel/Platform/POSIX/LastError.h>
#include <Varnel/Platform/Values/SystemText.h>

namespace Varnel::Platform::POSIX {
namespace {

namespace fs = std::filesystem;

constexpr mode_t folderMode = S_IRWXU;
constexpr mode_t fileMode = S_IRUSR | S_IWUSR;
constexpr mode_t modeBits = 07777;

// A database and what lies beside it.
constexpr std::array<const char*, 4> suffixes{"", "-journal", "-wal", "-shm"};

using Failure = std::optional<PlatformError>;

PlatformError refusal(const std::string& path, const char* why) {
  return PlatformError(std::string(privateFileRefusalDomain), 1,
                       {{std::string(localizedDescriptionKey), path + " " + why}});
}

PlatformError systemError(const std::string& path) {
  const std::error_code code = lastError();
  return PlatformError(code.category().name(), code.value(),
                       {{std::string(localizedDescriptionKey), path + ": " + code.message()}});
}

std::error_code invalidPath() {
  return std::make_error_code(std::errc::invalid_argument);
}

// Why this is not the user's own regular file, or null.
const char* objection(const struct stat& facts) {
  if (S_ISLNK(facts.st_mode)) return "is a link";
  if (!S_ISREG(facts.st_mode)) return "is no regular file";
  if (facts.st_uid != ::geteuid()) return "belongs to another user";
  return nullptr;
}

// Root may make folders anywhere. In another user's home they would lock that user out: of all
// settings, where the first folder of settings is made so.
Failure judgeParent(const fs::path& folder) {
  struct stat facts {};
  if (::geteuid() != 0 || ::lstat(folder.c_str(), &facts) != 0 || facts.st_uid == 0)
    return std::nullopt;
  return refusal(folder, "belongs to another user");
}

// The process's mask of modes may take rights away that a new folder or file is given. Some file
// systems know no modes.
Failure makeMissing(const fs::path& folder) {
  struct stat facts {};
  if (::lstat(folder.c_str(), &facts) == 0) return std::nullopt;
  if (folder.has_relative_path())
    if (auto error = makeMissing(folder.parent_path())) return error;
  if (auto error = judgeParent(folder.parent_path())) return error;
  if (::mkdir(folder.c_str(), folderMode) != 0)
    return errno == EEXIST ? std::nullopt : Failure(systemError(folder));
  static_cast<void>(::chmod(folder.c_str(), folderMode));
  return std::nullopt;
}

Failure judgeFolder(const std::string& folder) {
  struct stat facts {};
  if (::lstat(folder.c_str(), &facts) != 0) return systemError(folder);
  if (!S_ISDIR(facts.st_mode)) return refusal(folder, "is no folder");
  if (facts.st_uid != ::geteuid()) return refusal(folder, "belongs to another user");
  return std::nullopt;
}

Failure judgeFiles(const std::string& path) {
  for (const char* suffix : suffixes) {
    const std::string file = path + suffix;
    struct stat facts {};
    if (::lstat(file.c_str(), &facts) != 0) {
      if (errno != ENOENT) return systemError(file);
    } else if (const char* why = objection(facts)) {
      return refusal(file, why);
    }
  }
  return std::nullopt;
}

// Closing the descriptor of a new file drops nobody's locks.
Failure makeFile(const std::string& path) {
  struct stat facts {};
  if (::lstat(path.c_str(), &facts) == 0) return std::nullopt;
  const FileDescriptor made(
      ::open(path.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_NOFOLLOW | O_CLOEXEC, fileMode));
  if (!made) return errno == EEXIST ? std::nullopt : Failure(systemError(path));
  static_cast<void>(::fchmod(made.get(), fileMode));
  return std::nullopt;
}

// The descriptor leads to the file without opening it, and its name in /proc is the one way to set
// the file's mode through it. Where /proc is not mounted the path must do: its folder is the
// user's.
std::error_code protectFile(const std::string& path) {
  const FileDescriptor file(::open(path.c_str(), O_PATH | O_NOFOLLOW | O_CLOEXEC));
  if (!file) return errno == ENOENT ? std::error_code() : lastError();
  struct stat facts {};
  if (::fstat(file.get(), &facts) != 0) return lastError();
  if (objection(facts)) return std::make_error_code(std::errc::invalid_argument);
  if ((facts.st_mode & modeBits) == fileMode) return {};
  const std::string name = "/proc/self/fd/" + std::to_string(file.get());
  if (::chmod(name.c_str(), fileMode) == 0) return {};
  if (errno == ENOENT && ::chmod(path.c_str(), fileMode) == 0) return {};
  // A file system without modes, or one that cannot be written.
  return errno == EPERM || errno == EROFS || errno == ENOTSUP ? std::error_code() : lastError();
}

// A lock of the open file description: unlike one of the process, it outlives the closing of other
// descriptors. A forked child shares it, so it is freed and not left to the last descriptor.
class DescriptionLock final : public FileLock {
 public:
  explicit DescriptionLock(FileDescriptor file) : file_(std::move(file)) {}
  ~DescriptionLock() override { set(F_UNLCK); }

  [[nodiscard]] bool take() { return set(F_WRLCK); }

  /// Whether the path still leads to the locked file: another one is no protection.
  [[nodiscard]] bool isOf(const std::string& path) const {
    struct stat mine {};
    struct stat there {};
    return ::fstat(file_.get(), &mine) == 0 && ::lstat(path.c_str(), &there) == 0 &&
           mine.st_dev == there.st_dev && mine.st_ino == there.st_ino;
  }

 private:
  bool set(int kind) {
    struct flock lock {};
    lock.l_type = static_cast<short>(kind);
    lock.l_whence = SEEK_SET;
    return ::fcntl(file_.get(), F_OFD_SETLK, &lock) == 0;
  }

  FileDescriptor file_;
};

class OwnFiles final : public PrivateFiles {
 public:
  std::optional<PlatformError> makeFolders(const std::string& path) override {
    std::error_code failure;
    const fs::path given = fs::absolute(path, failure);
    const fs::path folder = failure ? fs::path() : fs::weakly_canonical(given, failure);
    if (failure) return PlatformError(failure);
    if (auto error = makeMissing(folder)) return error;
    if (fs::is_directory(folder, failure)) return std::nullopt;
    errno = ENOTDIR;
    return systemError(folder);
  }

  Result<std::string> prepare(const std::string& path) override {
    if (isCutShort(path)) return PlatformError(invalidPath());
    std::error_code failure;
    const fs::path given = fs::absolute(path, failure);
    const fs::path folder =
        failure ? fs::path() : fs::weakly_canonical(given.parent_path(), failure);
    if (failure) return PlatformError(failure);
    const std::string resolved = folder / given.filename();
    Failure error = makeMissing(folder);
    if (!error) error = judgeFolder(folder);
    if (!error) error = judgeFiles(resolved);
    if (!error) error = makeFile(resolved);
    if (error) return *error;
    return resolved;
  }

  std::error_code protect(const std::string& path) override {
    if (isCutShort(path)) return invalidPath();
    for (const char* suffix : suffixes)
      if (const auto failure = protectFile(path + suffix)) return failure;
    return {};
  }

  std::optional<FileIdentity> identity(const std::string& path) override {
    struct stat facts {};
    if (isCutShort(path) || ::lstat(path.c_str(), &facts) != 0) return std::nullopt;
    return FileIdentity{
        .device = facts.st_dev, .inode = facts.st_ino, .isEmpty = facts.st_size == 0};
  }

  Result<std::unique_ptr<FileLock>> tryLock(const std::string& path) override {
    const auto prepared = prepare(path);
    if (!prepared) return prepared.error();
    FileDescriptor file(::open(prepared->c_str(), O_RDWR | O_NOFOLLOW | O_CLOEXEC));
    if (!file) return systemError(*prepared);
    auto lock = std::make_unique<DescriptionLock>(std::move(file));
    if (!lock->take()) {
      if (errno == EAGAIN || errno == EACCES) return std::unique_ptr<FileLock>();
      return systemError(*prepared);
    }
    // Somebody has removed the file meanwhile, and may have locked the next.
    if (!lock->isOf(*prepared)) lock.reset();
    return std::unique_ptr<FileLock>(std::move(lock));
  }

  std::error_code rename(const std::string& from, const std::string& to) override {
    if (isCutShort(from) || isCutShort(to)) return invalidPath();
    return ::rename(from.c_str(), to.c_str()) == 0 ? std::error_code() : lastError();
  }

  std::error_code remove(const std::string& path) override {
    if (isCutShort(path)) return invalidPath();
    return ::unlink(path.c_str()) == 0 || errno == ENOENT ? std::error_code() : lastError();
  }
};

}  // namespace

std::unique_ptr<PrivateFiles> makePrivateFiles() {
  return std::make_unique<OwnFiles>();
}

}  // namespace Varnel::Platform::POSIX
