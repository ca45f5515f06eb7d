// SPDX-License-Identifier: MIT
#pragma once

#include <fcntl.h>
#include <linux/loop.h>
#include <sys/ioctl.h>
#include <sys/mount.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <string>

#include <Varnel/Platform/POSIX/FileDescriptor.h>

namespace Varnel::Tests {

/// A small ext4 file system in a file, behind a loop device that is detached when the last user has
/// gone.
class DiskImage final {
 public:
  explicit DiskImage(const std::filesystem::path& file) {
    std::ofstream(file).close();
    std::filesystem::resize_file(file, 4 << 20);
    if (std::system(("mkfs.ext4 -q -F '" + file.string() + "'").c_str()) != 0) return;
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
    return ::mount(("/dev/" + name_).c_str(), folder.c_str(), "ext4", 0, nullptr) == 0;
  }

 private:
  Platform::POSIX::FileDescriptor device_;
  std::string name_;
};

}  // namespace Varnel::Tests
