// SPDX-License-Identifier: MIT
#include <Varnel/Platform/POSIX/ReplacedFile.h>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <array>
#include <chrono>
#include <filesystem>
#include <thread>
#include <utility>

#include <Varnel/Platform/POSIX/FileDescriptor.h>
#include <Varnel/Platform/POSIX/LastError.h>
#include <Varnel/Platform/Ports/PrivateFiles.h>

namespace Varnel::Platform::POSIX {
namespace {

using namespace std::chrono_literals;
using Clock = std::chrono::steady_clock;

// A writer holds the lock for as long as a disk takes to keep a few kilobytes.
constexpr auto maxWait = 1s;
constexpr auto pause = 2ms;

constexpr std::size_t maxSize = 1 << 20;
constexpr ::mode_t ownerOnly = S_IRUSR | S_IWUSR;

std::optional<PlatformError> failure(std::error_code code) {
  if (!code) return std::nullopt;
  return PlatformError(code);
}

// Neither follows a link nor waits for the writer of a pipe.
Result<std::optional<std::string>, std::error_code> read(const std::string& path) {
  const FileDescriptor file(::open(path.c_str(), O_RDONLY | O_NOFOLLOW | O_NONBLOCK | O_CLOEXEC));
  if (!file && (errno == ENOENT || errno == ENOTDIR)) return std::optional<std::string>();
  struct stat facts {};
  if (!file || ::fstat(file.get(), &facts) != 0) return lastError();
  if (!S_ISREG(facts.st_mode)) return std::make_error_code(std::errc::invalid_argument);
  if (facts.st_uid != ::geteuid()) return std::make_error_code(std::errc::permission_denied);

  std::string bytes;
  for (std::array<char, 4096> buffer{};;) {
    const ssize_t count = ::read(file.get(), buffer.data(), buffer.size());
    if (count == 0) return std::optional(std::move(bytes));
    if (count < 0 && errno == EINTR) continue;
    if (count < 0) return lastError();
    bytes.append(buffer.data(), static_cast<std::size_t>(count));
    if (bytes.size() > maxSize) return std::make_error_code(std::errc::file_too_large);
  }
}

std::error_code writeDurably(const std::string& path, std::string_view bytes) {
  const FileDescriptor file(
      ::open(path.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_NOFOLLOW | O_CLOEXEC, ownerOnly));
  // The host's mask may have taken even the owner's rights away.
  if (!file || ::fchmod(file.get(), ownerOnly) != 0) return lastError();
  while (!bytes.empty()) {
    const ssize_t written = ::write(file.get(), bytes.data(), bytes.size());
    if (written < 0 && errno == EINTR) continue;
    if (written < 0) return lastError();
    bytes.remove_prefix(static_cast<std::size_t>(written));
  }
  return ::fsync(file.get()) == 0 ? std::error_code() : lastError();
}

// Until then a loss of power may bring the old text back. Some file systems know no such request.
std::error_code synchroniseFolderOf(const std::string& path) {
  const std::string folder = std::filesystem::path(path).parent_path().string();
  const FileDescriptor descriptor(::open(folder.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
  if (!descriptor) return lastError();
  return ::fsync(descriptor.get()) == 0 || errno == EINVAL ? std::error_code() : lastError();
}

}  // namespace

ReplacedFile::ReplacedFile(PrivateFiles& files, std::string path)
    : files_(files), path_(std::move(path)) {}

Result<std::optional<std::string>> ReplacedFile::text() const {
  auto text = read(path_);
  if (!text) return PlatformError(text.error());
  return std::move(*text);
}

Result<std::unique_ptr<FileLock>> ReplacedFile::lock() {
  for (const auto deadline = Clock::now() + maxWait;;) {
    auto lock = files_.tryLock(path_ + ".lock");
    if (!lock || *lock) return lock;
    if (Clock::now() > deadline) return PlatformError(std::make_error_code(std::errc::timed_out));
    std::this_thread::sleep_for(pause);
  }
}

std::optional<PlatformError> ReplacedFile::replace(std::string_view text) {
  // Nobody could read it again, nor change it.
  if (text.size() > maxSize) return failure(std::make_error_code(std::errc::file_too_large));
  const auto path = files_.prepare(path_);
  if (!path) return path.error();
  const std::string half = *path + ".new";
  if (const auto code = files_.remove(half)) return failure(code);
  auto code = writeDurably(half, text);
  if (!code) code = files_.rename(half, *path);
  if (!code) return failure(synchroniseFolderOf(*path));
  static_cast<void>(files_.remove(half));  // what stands in the way is said already
  return failure(code);
}

std::optional<PlatformError> ReplacedFile::setAside() {
  const auto path = files_.prepare(path_);
  if (!path) return path.error();
  return failure(files_.rename(*path, *path + ".damaged"));
}

}  // namespace Varnel::Platform::POSIX
