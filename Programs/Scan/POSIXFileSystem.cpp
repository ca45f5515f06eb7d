// SPDX-License-Identifier: MIT
#include <dirent.h>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <climits>
#include <utility>
#include <vector>

#include <Scan/FileSystem.h>
#include <Scan/SystemCalls.h>
#include <Varnel/Platform/Ports/TracelessReader.h>

namespace Orvane {
namespace {

std::error_code lastError() {
  return {errno, std::generic_category()};
}

class Descriptor final {
 public:
  explicit Descriptor(int number) : number_(number) {}
  Descriptor(Descriptor&& other) noexcept : number_(std::exchange(other.number_, -1)) {}
  Descriptor& operator=(Descriptor&& other) noexcept {
    std::swap(number_, other.number_);
    return *this;
  }
  ~Descriptor() {
    if (number_ >= 0) ::close(number_);
  }

  [[nodiscard]] int get() const { return number_; }

 private:
  int number_;
};

/// Whether the file has no content but holes.
bool isHole(int descriptor) {
  return ::lseek(descriptor, 0, SEEK_DATA) < 0 && errno == ENXIO;
}

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
  return openWithoutLinksAtOnce(folder, path.c_str(), flags);
}

/// Opens a path of any length, absolute or below the folder `base`, and follows no symbolic link in
/// any part of it, so that a folder that was swapped for one leads nowhere. Goes down by
/// descriptors and holds two at most.
Descriptor openWithoutLinks(int base, std::string_view path, int flags) {
  Descriptor reached(-1);
  for (Stride stride = Stride::longest;;) {
    const std::size_t end = endOfStep(path, stride);
    const bool isLast = end == path.size();
    Descriptor next(openStep(base, std::string(path.substr(0, end)),
                             (isLast ? flags : openToPassThrough) | O_CLOEXEC, stride));
    // Not every system has the call for more than one name, and some sandboxes forbid it.
    if (next.get() < 0 && stride == Stride::longest && (errno == ENOSYS || errno == EPERM)) {
      stride = Stride::oneName;
      continue;
    }
    if (next.get() < 0 || isLast) return next;
    reached = std::move(next);
    base = reached.get();
    path.remove_prefix(end + 1);
  }
}

// A moment that no 64 bits hold wraps around; it is still another than those near it.
std::int64_t nanosecondsOf(const struct timespec& moment) {
  return static_cast<std::int64_t>(static_cast<std::uint64_t>(moment.tv_sec) * 1'000'000'000 +
                                   static_cast<std::uint64_t>(moment.tv_nsec));
}

FileStatus statusFrom(const struct stat& facts) {
  return {.identity = {.device = facts.st_dev, .inode = facts.st_ino},
          .size = static_cast<std::uint64_t>(facts.st_size),
          .modifiedAt = nanosecondsOf(facts.st_mtim),
          .allocated = static_cast<std::uint64_t>(facts.st_blocks) * 512,
          .links = static_cast<std::uint32_t>(facts.st_nlink),
          .changedAt = nanosecondsOf(facts.st_ctim)};
}

class DescriptorFile final : public OpenFile {
 public:
  DescriptorFile(Descriptor descriptor, CacheUse cacheUse) : descriptor_(std::move(descriptor)) {
    if (cacheUse == CacheUse::traceless) traceless_.emplace(descriptor_.get());
  }

  FileResult<std::size_t> read(std::uint64_t offset, std::span<std::byte> buffer) override {
    if (traceless_) return traceless_->read(buffer, offset);
    for (;;) {
      // Unlike a plain read it takes nothing from a pipe that stands where the file was.
      const ssize_t count =
          ::pread(descriptor_.get(), buffer.data(), buffer.size(), static_cast<off_t>(offset));
      if (count >= 0) return static_cast<std::size_t>(count);
      if (errno != EINTR) return lastError();
    }
  }

  FileResult<FileStatus> status() override {
    struct stat facts;
    if (::fstat(descriptor_.get(), &facts) != 0) return lastError();
    FileStatus status = statusFrom(facts);
    // Some systems count no blocks at all.
    if (status.allocated == 0 && !isHole(descriptor_.get())) status.allocated = status.size;
    return status;
  }

  std::optional<std::uint64_t> place() override { return placeOf(descriptor_.get()); }

  std::optional<SharedExtents> sharedExtents() override {
    return sharedExtentsOf(descriptor_.get());
  }

  FileResult<std::optional<std::uint64_t>> share(OpenFile& source, std::uint64_t offset,
                                                 std::uint64_t length) override {
    const int from = static_cast<DescriptorFile&>(source).descriptor_.get();
    return shareRange(from, descriptor_.get(), offset, length);
  }

 private:
  Descriptor descriptor_;
  std::optional<Varnel::Platform::TracelessReader> traceless_;
};

class DescriptorFolder final : public OpenFolder {
 public:
  DescriptorFolder(Descriptor descriptor, FileIdentity identity, CacheUse cacheUse)
      : descriptor_(std::move(descriptor)), identity_(identity), cacheUse_(cacheUse) {}

  [[nodiscard]] int number() const { return descriptor_.get(); }
  [[nodiscard]] FileIdentity identity() const override { return identity_; }

  FileResult<bool> list(const std::function<void(const FolderEntry&)>& visit) override {
    if (next_ == entries_.size()) {
      const auto more = readEntries();
      if (!more || !*more) return more;
    }
    for (const std::size_t end = std::min(next_ + maxVisits, entries_.size()); next_ < end; ++next_)
      visitEntry(*entries_[next_], visit);
    return true;
  }

  FolderEntry look(const char* name) override {
    using Kind = FolderEntry::Kind;
    struct stat facts;
    if (::fstatat(number(), name, &facts, AT_SYMLINK_NOFOLLOW) != 0)
      return {.kind = Kind::failure, .name = name, .inode = 0, .error = lastError()};
    if (S_ISDIR(facts.st_mode)) return {.kind = Kind::folder, .name = name, .inode = facts.st_ino};
    if (!S_ISREG(facts.st_mode)) return {.kind = Kind::other, .name = name, .inode = 0};
    return {.kind = Kind::file, .name = name, .inode = 0, .status = statusFrom(facts)};
  }

  [[nodiscard]] bool keepsNumbers() const override { return Orvane::keepsNumbers(number()); }

  [[nodiscard]] bool mayShareExtents() const override { return tellsSharedExtents(number()); }

  FileResult<std::unique_ptr<OpenFile>> open(const char* name, ReadingPlan plan) override {
    Descriptor descriptor(
        ::openat(number(), name, O_RDONLY | O_NONBLOCK | O_NOCTTY | O_NOFOLLOW | O_CLOEXEC));
    if (descriptor.get() < 0 && errno == EAGAIN)
      descriptor = Descriptor(openLeased(number(), name));
    if (descriptor.get() < 0) return lastError();
    // Without read-ahead, a cold disk reads only the parts.
    if (plan == ReadingPlan::parts) ::posix_fadvise(descriptor.get(), 0, 0, POSIX_FADV_RANDOM);
    std::unique_ptr<OpenFile> file =
        std::make_unique<DescriptorFile>(std::move(descriptor), cacheUse_);
    return file;
  }

 private:
  /// Each may cost a disk that must work, or a share, some milliseconds.
  static constexpr std::size_t maxVisits = 32;
  static constexpr std::size_t bufferLength = std::size_t{64} << 10;

  /// Fetches the next entries from the system, in the order in which their facts lie on most disks.
  FileResult<bool> readEntries() {
    if (!buffer_) buffer_ = std::make_unique_for_overwrite<char[]>(bufferLength);
    entries_.clear();
    next_ = 0;
    const ssize_t size = ::getdents64(number(), buffer_.get(), bufferLength);
    if (size <= 0) buffer_.reset();
    if (size < 0) return lastError();
    for (ssize_t at = 0; at < size;) {
      const auto* const entry = reinterpret_cast<const dirent64*>(buffer_.get() + at);
      at += entry->d_reclen;
      const std::string_view name = entry->d_name;
      if (name != "." && name != "..") entries_.push_back(entry);
    }
    std::sort(entries_.begin(), entries_.end(),
              [](const dirent64* a, const dirent64* b) { return a->d_ino < b->d_ino; });
    return size > 0;
  }

  /// The kind that comes with the name saves asking for the status of folders.
  void visitEntry(const dirent64& listed, const std::function<void(const FolderEntry&)>& visit) {
    using Kind = FolderEntry::Kind;
    const char* const name = listed.d_name;
    if (listed.d_type == DT_DIR)
      return visit({.kind = Kind::folder, .name = name, .inode = listed.d_ino});
    if (listed.d_type != DT_REG && listed.d_type != DT_UNKNOWN)
      return visit({.kind = Kind::other, .name = name, .inode = 0});
    visit(look(name));
  }

  Descriptor descriptor_;
  FileIdentity identity_;
  CacheUse cacheUse_;
  std::unique_ptr<char[]> buffer_;  ///< While the folder is listed.
  std::vector<const dirent64*> entries_;
  std::size_t next_ = 0;  ///< Of the entries.
};

class POSIXFileSystem final : public FileSystem {
 public:
  explicit POSIXFileSystem(CacheUse cacheUse) : cacheUse_(cacheUse) {}

  FileResult<std::unique_ptr<OpenFolder>> openFolder(OpenFolder* base,
                                                     const std::string& path) override {
    const int start = base ? static_cast<DescriptorFolder*>(base)->number() : AT_FDCWD;
    Descriptor descriptor = openWithoutLinks(start, path, O_RDONLY | O_DIRECTORY);
    struct stat facts;
    if (descriptor.get() < 0 || ::fstat(descriptor.get(), &facts) != 0) return lastError();
    const CacheUse cacheUse = isInMemory(descriptor.get()) ? CacheUse::normal : cacheUse_;
    std::unique_ptr<OpenFolder> folder = std::make_unique<DescriptorFolder>(
        std::move(descriptor), statusFrom(facts).identity, cacheUse);
    return folder;
  }

 private:
  const CacheUse cacheUse_;
};

}  // namespace

FileSystem& systemFileSystem(CacheUse cacheUse) {
  static POSIXFileSystem normal(CacheUse::normal);
  static POSIXFileSystem traceless(CacheUse::traceless);
  return cacheUse == CacheUse::normal ? normal : traceless;
}

}  // namespace Orvane
