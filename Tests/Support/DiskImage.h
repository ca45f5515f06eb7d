// SPDX-License-Identifier: MIT
#pragma once

#include <fcntl.h>
#include <linux/loop.h>
#include <sys/ioctl.h>
#include <sys/mount.h>
#include <unistd.h>

#include <cstdint>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <string>
#include <utility>

#include <Varnel/Platform/POSIX/FileDescriptor.h>

namespace Varnel::Tests {

/// Gives what was written in the folder's file system its places there, and waits for no other.
inline void synchronise(const std::filesystem::path& folder) {
  const Platform::POSIX::FileDescriptor opened(
      ::open(folder.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC));
  ::syncfs(opened.get());
}

/// A file system in a file, behind a loop device that is detached when the last user has gone.
class DiskImage final {
 public:
  struct Kind {
    std::string name;   ///< As mount and mkfs have it.
    std::string force;  ///< What makes mkfs work on a file.
    std::uintmax_t bytes;
  };
  static Kind ext4() { return {"ext4", "-q -F", 4 << 20}; }
  static Kind xfs() { return {"xfs", "-q -f", 320 << 20}; }  // Smaller ones are not made.
  static Kind btrfs() { return {"btrfs", "-q -f", 160 << 20}; }

  explicit DiskImage(const std::filesystem::path& file, Kind kind = ext4())
      : kind_(std::move(kind)) {
    std::ofstream(file).close();
    std::filesystem::resize_file(file, kind_.bytes);
    const std::string maker = "mkfs." + kind_.name + " " + kind_.force + " '" + file.string() + "'";
    if (std::system((maker + " >/dev/null 2>&1").c_str()) != 0) return;
    const Platform::POSIX::FileDescriptor control(::open("/dev/loop-control", O_RDWR | O_CLOEXEC));
    const Platform::POSIX::FileDescriptor image(::open(file.c_str(), O_RDWR | O_CLOEXEC));
    const int number = ::ioctl(control.get(), LOOP_CTL_GET_FREE);
    if (number < 0) return;
    const std::string node = "/dev/loop" + std::to_string(number);
    device_ = Platform::POSIX::FileDescriptor(::open(node.c_str(), O_RDWR | O_CLOEXEC));
    loop_config config{};
    config.fd = static_cast<unsigned>(image.get());
    config.info.lo_flags = LO_FLAGS_AUTOCLEAR;
    if (::ioctl(device_.get(), LOOP_CONFIGURE, &config) == 0) name_ = node.substr(5);
  }

  /// The device's name, as in "loop0"; empty when this machine can make none.
  [[nodiscard]] const std::string& name() const { return name_; }

  [[nodiscard]] bool mount(const std::filesystem::path& folder) const {
    const std::string device = "/dev/" + name_;
    return ::mount(device.c_str(), folder.c_str(), kind_.name.c_str(), 0, nullptr) == 0;
  }

 private:
  const Kind kind_;
  Platform::POSIX::FileDescriptor device_;
  std::string name_;
};

}  // namespace Varnel::Tests
