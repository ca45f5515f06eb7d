// SPDX-License-Identifier: MIT
#include <dirent.h>
#include <fcntl.h>
#include <linux/openat2.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <climits>
#include <string_view>
#include <utility>

#include <Scan/FileSystem.h>

namespace Orvane {
namespace {

std::error_code lastError() {
  return {errno, std::generic_category()};
}

class Descriptor final {
 public:
  explicit Descriptor(int number) : number_(number) {}
  Descriptor(Descriptor&& other) noexcept : number_(other.release()) {}
  Descriptor& operator=(Descriptor&& other) noexcept {
    std::swap(number_, other.number_);
    return *this;
  }
  ~Descriptor() {
    if (number_ >= 0) ::close(number_);
  }

  [[nodiscard]] int get() const { return number_; }
  [[nodiscard]] int release() { return std::exchange(number_, -1); }

 private:
  int number_;
};

/// How far one step of `openWithoutLinks` goes.
enum class Stride { longest, oneName };

std::size_t endOfStep(std::string_view path, Stride stride) {
  if (stride == Stride::oneName) return std::min(path.find('/', 1), path.size());
  return path.size() < PATH_MAX ? path.size()
                                : std::min(path.rfind('/', PATH_MAX - 1), path.size());
}

int openStep(int folder, const std::string& path, int flags, Stride stride) {
  // In a path of one name, O_NOFOLLOW leaves nothing to follow.
  if (stride == Stride::oneName) return ::openat(folder, path.c_str(), flags | O_NOFOLLOW);
  open_how how{};
  how.flags = static_cast<unsigned>(flags);
  how.resolve = RESOLVE_NO_SYMLINKS;
  return static_cast<int>(::syscall(SYS_openat2, folder, path.c_str(), &how, sizeof how));
}

/// Opens an absolute path of any length and follows no symbolic link in any part of it, so that a
/// folder that was swapped for one leads nowhere. Goes down by descriptors and holds two at most.
Descriptor openWithoutLinks(std::string_view path, int flags) {
  Descriptor reached(AT_FDCWD);
  for (Stride stride = Stride::longest;;) {
    const std::size_t end = endOfStep(path, stride);
    const bool isLast = end == path.size();
    Descriptor next(openStep(reached.get(), std::string(path.substr(0, end)),
                             (isLast ? flags : O_PATH | O_DIRECTORY) | O_CLOEXEC, stride));
    // Kernels before 5.6 do not have the call for more than one name, some sandboxes forbid it.
    if (next.get() < 0 && stride == Stride::longest && (errno == ENOSYS || errno == EPERM)) {
      stride = Stride::oneName;
      continue;
    }
    if (next.get() < 0 || isLast) return next;
    reached = std::move(next);
    path.remove_prefix(end + 1);
  }
}

struct CloseFolder {
  void operator()(DIR* folder) const { ::closedir(folder); }
};

FileStatus statusFrom(const struct stat& facts) {
  return {.identity = {.device = facts.st_dev, .inode = facts.st_ino},
          .size = static_cast<std::uint64_t>(facts.st_size),
          .modifiedAt = std::int64_t{facts.st_mtim.tv_sec} * 1'000'000'000 + facts.st_mtim.tv_nsec};
}

class DescriptorFile final : public OpenFile {
 public:
  explicit DescriptorFile(Descriptor descriptor) : descriptor_(std::move(descriptor)) {}

  FileResult<std::size_t> read(std::span<std::byte> buffer) override {
    for (;;) {
      // Unlike a plain read it takes nothing from a pipe that stands where the file was.
      const ssize_t count = ::pread(descriptor_.get(), buffer.data(), buffer.size(), offset_);
      if (count >= 0) {
        offset_ += count;
        return static_cast<std::size_t>(count);
      }
      if (errno != EINTR) return lastError();
    }
  }

  FileResult<FileStatus> status() override {
    struct stat facts;
    if (::fstat(descriptor_.get(), &facts) != 0) return lastError();
    return statusFrom(facts);
  }

 private:
  Descriptor descriptor_;
  off_t offset_ = 0;
};

/// Adds the entry to the listing. The kind that comes with the name saves asking for the status of
/// anything but regular files.
void addEntry(FolderListing& listing, int folder, const dirent& entry) {
  const std::string_view name = entry.d_name;
  if (name == "." || name == "..") return;
  if (entry.d_type == DT_DIR) {
    listing.folders.emplace_back(name);
    return;
  }
  if (entry.d_type != DT_REG && entry.d_type != DT_UNKNOWN) return;
  struct stat facts;
  if (::fstatat(folder, entry.d_name, &facts, AT_SYMLINK_NOFOLLOW) != 0) {
    listing.failures.push_back({std::string(name), lastError()});
  } else if (S_ISDIR(facts.st_mode)) {
    listing.folders.emplace_back(name);
  } else if (S_ISREG(facts.st_mode)) {
    listing.files.push_back({std::string(name), statusFrom(facts)});
  }
}

class POSIXFileSystem final : public FileSystem {
 public:
  FileResult<FolderListing> list(const std::string& folder) override {
    Descriptor descriptor = openWithoutLinks(folder, O_RDONLY | O_DIRECTORY);
    if (descriptor.get() < 0) return lastError();
    struct stat facts;
    if (::fstat(descriptor.get(), &facts) != 0) return lastError();
    const std::unique_ptr<DIR, CloseFolder> stream(::fdopendir(descriptor.get()));
    if (!stream) return lastError();
    const int number = descriptor.release();

    FolderListing listing;
    listing.identity = statusFrom(facts).identity;
    for (;;) {
      errno = 0;
      const dirent* entry = ::readdir(stream.get());
      if (entry == nullptr) break;
      addEntry(listing, number, *entry);
    }
    if (errno != 0) listing.interruption = lastError();
    return listing;
  }

  FileResult<std::unique_ptr<OpenFile>> open(const std::string& path, ReadingPlan plan) override {
    Descriptor descriptor = openWithoutLinks(path, O_RDONLY | O_NONBLOCK | O_NOCTTY);
    if (descriptor.get() < 0) return lastError();
    // Without read-ahead, a cold disk reads only the beginning.
    if (plan == ReadingPlan::beginningOnly)
      ::posix_fadvise(descriptor.get(), 0, 0, POSIX_FADV_RANDOM);
    std::unique_ptr<OpenFile> file = std::make_unique<DescriptorFile>(std::move(descriptor));
    return file;
  }
};

}  // namespace

FileSystem& systemFileSystem() {
  static POSIXFileSystem fileSystem;
  return fileSystem;
}

}  // namespace Orvane
