// SPDX-License-Identifier: MIT
#pragma once

#include <filesystem>
#include <map>
#include <string>
#include <string_view>

#include <Tests/Support/TemporaryFolder.h>

namespace Varnel::Tests {

/// A machine's sysfs, made of folders and links as the kernel lays them out.
class SysfsMachine final {
 public:
  SysfsMachine() { std::filesystem::create_directories(root_.path() / "class/block"); }

  /// `place` is the device's folder below "devices/"; its last component is the device's name.
  void add(const std::string& place, const std::map<std::string, std::string>& attributes = {}) {
    const std::filesystem::path device = root_.path() / "devices" / place;
    std::filesystem::create_directories(device);
    for (const auto& [name, value] : attributes)
      root_.write("devices/" + place + '/' + name, value);
    std::filesystem::create_directory_symlink("../../devices/" + place,
                                              root_.path() / "class/block" / device.filename());
  }

  void remove(const std::string& name) const {
    std::filesystem::remove(root_.path() / "class/block" / name);
  }

  void setSubsystem(const std::string& place, const std::string& subsystem) {
    const std::filesystem::path device = root_.path() / "devices" / place;
    std::filesystem::create_directories(device);
    std::filesystem::create_directory_symlink("/bus/" + subsystem, device / "subsystem");
  }

  /// Also the carrier of the disk "…/0:0:0:0", which its attributes are reached through.
  void addSCSIDisk(const std::string& above, const std::string& name,
                   const std::map<std::string, std::string>& attributes) {
    setSubsystem(above + "/host0", "scsi");
    setSubsystem(above + "/host0/0:0:0:0", "scsi");
    const std::string place = above + "/host0/0:0:0:0/block/" + name;
    add(place, attributes);
    std::filesystem::create_directory_symlink("../..", root_.path() / "devices" / place / "device");
    carrier_ = "devices/" + above + "/host0/0:0:0:0/";
  }
  void writeOnCarrier(const std::string& name, std::string_view bytes) {
    root_.write(carrier_ + name, bytes);
  }

  void standOn(const std::string& name, const std::string& lower) {
    root_.write("class/block/" + name + "/slaves/" + lower, "");
  }

  /// Where its block devices are listed.
  std::string folder() const { return root_.path() / "class/block"; }

 private:
  TemporaryFolder root_;
  std::string carrier_;
};

}  // namespace Varnel::Tests
