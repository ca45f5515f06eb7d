// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Ports/AppendFiles.h>

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <filesystem>

#include <Varnel/Platform/POSIX/Adapters.h>
#include <Varnel/Platform/POSIX/FileDescriptor.h>
#include <Varnel/Platform/POSIX/LastError.h>
#include <Varnel/Platform/POSIX/SuppressedSignal.h>
#include <Varnel/Platform/Values/SystemText.h>

namespace Varnel::Platform::POSIX {
namespace {

class DescriptorAppendFile final : public AppendFile {
 public:
  explicit DescriptorAppendFile(FileDescriptor descriptor) : descriptor_(std::move(descriptor)) {}

  std::error_code append(std::string_view bytes) override {
    SuppressedSignal tooLarge(SIGXFSZ);
    while (!bytes.empty()) {
      const ssize_t written = ::write(descriptor_.get(), bytes.data(), bytes.size());
      if (written < 0 && errno == EINTR) continue;
      if (written < 0) {
        const std::error_code error = lastError();
        if (error == std::errc::file_too_large) tooLarge.consume();
        return error;
      }
      bytes.remove_prefix(static_cast<std::size_t>(written));
    }
    return {};
  }

 private:
  FileDescriptor descriptor_;
};

// Root would lock the owner of the folder out of a file that it makes there, and follow the owner's
// links to any other.
bool isAnothersFolder(const std::filesystem::path& folder) {
  struct stat facts {};
  return ::geteuid() == 0 && ::stat(folder.c_str(), &facts) == 0 && facts.st_uid != 0;
}

class DescriptorAppendFiles final : public AppendFiles {
 public:
  Result<std::unique_ptr<AppendFile>, std::error_code> open(const std::string& path) override {
    if (isCutShort(path)) return std::make_error_code(std::errc::invalid_argument);
    if (isAnothersFolder(std::filesystem::path(path).parent_path()))
      return std::make_error_code(std::errc::operation_not_permitted);
    // O_APPEND makes the system choose the end anew for each write, so that two processes may share
    // the file.
    FileDescriptor descriptor(
        ::open(path.c_str(), O_WRONLY | O_APPEND | O_CREAT | O_CLOEXEC, S_IRUSR | S_IWUSR));
    if (!descriptor) return lastError();
    return std::unique_ptr<AppendFile>(
        std::make_unique<DescriptorAppendFile>(std::move(descriptor)));
  }
};

}  // namespace

std::unique_ptr<AppendFiles> makeAppendFiles() {
  return std::make_unique<DescriptorAppendFiles>();
}

}  // namespace Varnel::Platform::POSIX
