// SPDX-License-Identifier: MIT
#include <orvane-window/Model/FileExport.h>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>
#include <filesystem>

#include <Varnel/Platform/Values/URL.h>
#include <Varnel/Platform/Values/UTF8.h>
#include <Varnel/Platform/Values/UUID.h>
#include <Varnel/Platform/Values/UniqueHandle.h>
#include <orvane-window/Model/DuplicateList.h>

namespace Orvane {
namespace {

namespace fs = std::filesystem;

std::error_code lastError() {
  return {errno != 0 ? errno : EIO, std::generic_category()};
}

/// The file that is meant, behind the links to it.
Varnel::Platform::Result<fs::path, std::error_code> targetOf(const std::string& path) {
  std::error_code error;
  fs::path target = fs::canonical(path, error);
  if (error == std::errc::no_such_file_or_directory) return fs::path(path);
  if (error) return error;
  if (fs::is_regular_file(target, error)) return target;
  return error ? error
               : std::make_error_code(fs::is_directory(target) ? std::errc::is_a_directory
                                                               : std::errc::not_supported);
}

/// A file under a name that nothing else has, beside the one whose place it takes once it is whole.
/// Until then it goes with the object.
class Replacement final {
 public:
  explicit Replacement(fs::path target)
      : target_(std::move(target)),
        path_(target_.parent_path() / (".orvane-" + Varnel::Platform::randomUUIDString())) {
    struct stat before {};
    const bool replaces = ::stat(target_.c_str(), &before) == 0;
    // Who could not read what was there reads nothing of this, not even before the group is its
    // own.
    const int made =
        ::open(path_.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, replaces ? 0600 : 0666);
    if (made < 0) return;
    isThere_ = true;
    // Some file systems know no modes.
    if (replaces) {
      const bool isOfGroup = ::fchown(made, static_cast<::uid_t>(-1), before.st_gid) == 0;
      (void)::fchmod(made, before.st_mode & (isOfGroup ? 0777u : 0707u));
    }
    file_ = File(::fdopen(made, "wb"));
    if (!file_) ::close(made);
  }
  ~Replacement() {
    if (isThere_) ::unlink(path_.c_str());
  }
  Replacement(const Replacement&) = delete;
  Replacement& operator=(const Replacement&) = delete;

  explicit operator bool() const { return static_cast<bool>(file_); }

  [[nodiscard]] bool add(std::string_view text) {
    return std::fwrite(text.data(), 1, text.size(), file_.get()) == text.size();
  }

  /// Not before the text is on the disk.
  [[nodiscard]] bool takePlace() {
    if (std::fflush(file_.get()) != 0) return false;
    if (::fsync(::fileno(file_.get())) != 0 && errno != EINVAL) return false;
    isThere_ = ::rename(path_.c_str(), target_.c_str()) != 0;
    return !isThere_;
  }

 private:
  using File = Varnel::Platform::UniqueHandle<std::FILE*, &std::fclose>;

  const fs::path target_;
  const fs::path path_;
  bool isThere_ = false;
  File file_;
};

}  // namespace

std::error_code writeFile(const std::string& path, const TextSource& source) {
  auto target = targetOf(path);
  if (!target) return target.error();
  Replacement file(*std::move(target));
  if (!file) return lastError();
  errno = 0;  // A source tells no reason of its own.
  const bool isWritten =
      source([&](std::string_view text) { return file.add(text); }) && file.takePlace();
  return isWritten ? std::error_code() : lastError();
}

std::string plainPath(const std::string& path) {
  const bool isLine = Varnel::Platform::isValidUTF8(path) && path.find('\n') == std::string::npos;
  return isLine ? path : Varnel::Platform::URL::fileURLWithPath(path).absoluteString();
}

bool writeChosenFiles(const DuplicateList& list, const TextWriter& write) {
  TextParts parts(write);
  const auto& groups = list.report()->groups;
  for (std::size_t i = 0; i < groups.size(); ++i)
    for (std::size_t k = 0; k < groups[i].files.size(); ++k)
      if (list.isChosen({i, k}) && !parts.add(plainPath(groups[i].files[k].path) + "\n"))
        return false;
  return parts.flush();
}

}  // namespace Orvane
