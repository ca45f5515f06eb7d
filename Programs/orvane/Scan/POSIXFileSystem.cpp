// SPDX-License-Identifier: MIT
#include <dirent.h>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <string_view>

#include <orvane/Scan/FileSystem.h>

namespace Orvane {
namespace {

std::error_code lastError() {
  return {errno, std::generic_category()};
}

class Descriptor final {
 public:
  explicit Descriptor(int number) : number_(number) {}
  Descriptor(const Descriptor&) = delete;
  Descriptor& operator=(const Descriptor&) = delete;
  ~Descriptor() {
    if (number_ >= 0) ::close(number_);
  }

  [[nodiscard]] int get() const { return number_; }
  [[nodiscard]] int release() { return std::exchange(number_, -1); }

 private:
  int number_;
};

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
  explicit DescriptorFile(int descriptor) : descriptor_(descriptor) {}

  FileResult<std::size_t> read(std::span<std::byte> buffer) override {
    for (;;) {
      const ssize_t count = ::read(descriptor_.get(), buffer.data(), buffer.size());
      if (count >= 0) return static_cast<std::size_t>(count);
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
    Descriptor descriptor(::open(folder.c_str(), O_RDONLY | O_DIRECTORY | O_NOFOLLOW | O_CLOEXEC));
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
    if (errno != 0) return lastError();
    return listing;
  }

  FileResult<std::unique_ptr<OpenFile>> open(const std::string& path, ReadingPlan plan) override {
    const int descriptor =
        ::open(path.c_str(), O_RDONLY | O_NOFOLLOW | O_NONBLOCK | O_NOCTTY | O_CLOEXEC);
    if (descriptor < 0) return lastError();
    std::unique_ptr<OpenFile> file = std::make_unique<DescriptorFile>(descriptor);
    // Without read-ahead a cold disk is asked for the beginning alone.
    if (plan == ReadingPlan::beginningOnly) ::posix_fadvise(descriptor, 0, 0, POSIX_FADV_RANDOM);
    return file;
  }
};

}  // namespace

FileSystem& systemFileSystem() {
  static POSIXFileSystem fileSystem;
  return fileSystem;
}

}  // namespace Orvane
