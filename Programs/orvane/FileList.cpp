// SPDX-License-Identifier: MIT
#include <orvane/FileList.h>

#include <fcntl.h>
#include <unistd.h>

#include <array>
#include <cerrno>
#include <filesystem>
#include <string_view>
#include <system_error>
#include <utility>

namespace Orvane {
namespace {

namespace fs = std::filesystem;

/// No path is longer. What is, is another kind of file.
constexpr std::size_t maxNameLength = 1 << 20;

/// Collects paths by their folders.
class Collector final {
 public:
  void add(std::string path) {
    while (path.size() > 1 && path.ends_with('/')) path.pop_back();
    const std::size_t slash = path.rfind('/');
    const bool hasFolder = slash != std::string::npos;
    std::string name = hasFolder ? path.substr(slash + 1) : path;
    path.resize(hasFolder ? slash + 1 : 0);
    if (path != given_ || !names_) {
      names_ = &files_[resolved(path)];
      given_ = std::move(path);
    }
    names_->push_back(std::move(name));
  }

  [[nodiscard]] FilesByFolder take() { return std::move(files_); }

 private:
  static std::string resolved(const std::string& given) {
    const fs::path folder = given.empty() ? "." : given;
    std::error_code error;
    const fs::path path = fs::canonical(folder, error);
    if (!error) return path.string();
    // Its files are lost, one by one.
    std::string absent = fs::absolute(folder).lexically_normal().string();
    while (absent.size() > 1 && absent.ends_with('/')) absent.pop_back();
    return absent;
  }

  FilesByFolder files_;
  std::string given_;                          ///< The folder of the last path, with its slash, and
  std::vector<std::string>* names_ = nullptr;  ///< its names.
};

class Input final {
 public:
  explicit Input(const std::string& name)
      : isOwn_(name != "-"),
        number_(isOwn_ ? ::open(name.c_str(), O_RDONLY | O_CLOEXEC) : STDIN_FILENO) {}
  ~Input() {
    if (isOwn_ && number_ >= 0) ::close(number_);
  }
  Input(const Input&) = delete;
  Input& operator=(const Input&) = delete;

  /// The next bytes, none at the end; negative with `errno` when it cannot be read.
  template <std::size_t size>
  [[nodiscard]] ssize_t read(std::array<char, size>& buffer) const {
    for (;;) {
      const ssize_t count = ::read(number_, buffer.data(), size);
      if (count >= 0 || errno != EINTR) return count;
    }
  }

 private:
  const bool isOwn_;
  const int number_;
};

}  // namespace

Varnel::Platform::Result<FilesByFolder, std::string> readFileList(const std::string& name,
                                                                  NameEnd end) {
  const Input input(name);
  Collector files;
  std::string path;
  std::array<char, std::size_t{64} << 10> buffer;
  for (ssize_t count; (count = input.read(buffer)) != 0;) {
    if (count < 0) return std::generic_category().message(errno);
    std::string_view text(buffer.data(), static_cast<std::size_t>(count));
    if (end == NameEnd::line && text.find('\0') != std::string_view::npos)
      return std::string("it has null characters, as --null reads them");
    for (std::size_t at; (at = text.find(static_cast<char>(end))) != std::string_view::npos;) {
      path += text.substr(0, at);
      text.remove_prefix(at + 1);
      if (!path.empty()) files.add(std::exchange(path, {}));
    }
    path += text;
    if (path.size() > maxNameLength) return std::string("it is no list of paths");
  }
  if (!path.empty()) files.add(std::move(path));
  return files.take();
}

}  // namespace Orvane
