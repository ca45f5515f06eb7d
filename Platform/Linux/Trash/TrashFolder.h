// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>
#include <string_view>
#include <system_error>
#include <vector>

#include <Varnel/Platform/Linux/Trash/HeldFolder.h>
#include <Varnel/Platform/Values/Date.h>

namespace Varnel::Platform::Linux {

/// The file beside a file in the trash that tells where it was. Its name holds the other's.
struct InfoFile final {
  int folder;  ///< The trash's, which outlives this.
  std::string name;
  POSIX::FileDescriptor file;

  /// Whether it is still there, and no other's: several programs empty the trash.
  [[nodiscard]] bool isThere() const;
  /// Removes it where it is still there.
  void remove() const;
  /// Its bytes; absent when they are too many.
  [[nodiscard]] std::optional<std::string> text() const;
};

/// One trash of this user: a folder with "files", and "info" that tells where each file was. An
/// info file is on the disk before its file comes, and goes after it. A value of one owner.
class TrashFolder final {
 public:
  /// By its path, in which no link may be. Nothing is made.
  [[nodiscard]] static Result<TrashFolder, std::error_code> open(const std::string& path);
  /// Whether the disk of the trash with this path is there: that of a volume is mounted, and that
  /// of the trash `home` has the folder above it. Another disk in its place is not told from it.
  [[nodiscard]] static bool isDiskThere(const std::string& path, const std::string& home);

  /// The user's own, if it is on the mount that the folder lies on (else `cross_device_link`). What
  /// is missing in it is made.
  [[nodiscard]] static Result<TrashFolder, std::error_code> atHome(const std::string& path,
                                                                   const HeldFolder& folder);
  /// The user's on the volume that the folder lies on. What is missing is made.
  [[nodiscard]] static Result<TrashFolder, std::error_code> ofVolume(const HeldFolder& folder);

  /// Whether the path lies in the trash `home`, or in what has the name of another one.
  [[nodiscard]] static bool isInOne(std::string_view path, const std::string& home);

  [[nodiscard]] const std::string& path() const { return path_; }
  [[nodiscard]] int files() const { return files_.get(); }
  [[nodiscard]] std::size_t maxName() const;

  /// Takes a name for a file that was at `path`, or fails with `file_exists`.
  [[nodiscard]] Result<InfoFile, std::error_code> reserve(const std::string& name,
                                                          std::string_view path,
                                                          Date deleted) const;

  [[nodiscard]] std::optional<InfoFile> info(const std::string& name) const;
  /// Where a file was, as its info file tells.
  [[nodiscard]] std::optional<std::string> pathIn(const InfoFile& info) const;

  /// The names of what is there, sorted.
  [[nodiscard]] Result<std::vector<std::string>, std::error_code> names() const;

 private:
  TrashFolder(std::string path, std::optional<std::string> volume, POSIX::FileDescriptor files,
              POSIX::FileDescriptor info);
  static Result<TrashFolder, std::error_code> openIn(int folder, std::string path, Missing missing);

  std::string path_;
  std::optional<std::string> volume_;  ///< In one of a volume, paths are relative to its folder.
  POSIX::FileDescriptor files_;
  POSIX::FileDescriptor info_;
};

}  // namespace Varnel::Platform::Linux
