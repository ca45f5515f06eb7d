// SPDX-License-Identifier: MIT
#include <Tests/Contract/DiskWorlds.h>

#include <sys/stat.h>
#include <sys/sysmacros.h>

#include <Tests/Support/MountNamespace.h>
#include <Tests/Support/SysfsMachine.h>
#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Platform/Linux/Adapters.h>
#include <Varnel/Platform/Linux/Disks/MountTable.h>

namespace Varnel::Platform::Contract {
namespace {

namespace fs = std::filesystem;

class SysfsDisks final : public DeviceRegistryWorld {
 public:
  DeviceRegistry& port() override { return *registry_; }
  void plug(const std::string& name, const std::string& serial) override {
    const std::string above = "pci0/" + name;
    machine_.setSubsystem(above, "virtio");
    const std::string disk = above + "/block/" + name;
    machine_.add(disk, {{"serial", serial}, {"queue/rotational", "1\n"}});
    machine_.add(disk + "/" + name + "1", {{"partition", "1\n"}});
  }
  void unplug(const std::string& name) override {
    for (const char* part : {"", "1"}) machine_.remove(name + part);
  }
  void putOn(const std::string& name, const std::vector<std::string>& lower) override {
    machine_.add("virtual/block/" + name);
    for (const std::string& device : lower) machine_.standOn(name, device);
  }

 private:
  Tests::SysfsMachine machine_;
  const std::unique_ptr<DeviceRegistry> registry_ = Linux::makeDeviceRegistry(machine_.folder());
};
INSTANTIATE_TEST_SUITE_P(Linux, DeviceRegistryContract, on<SysfsDisks>());

// The disk that the temporary folder lies on. Binding a folder mounts its disk in another place.
class BoundFolders final : public DiskArbitrationWorld {
 public:
  ~BoundFolders() override {
    if (isLost_) ::umount2("/proc", MNT_DETACH);
    for (const auto& place : fs::directory_iterator(folder_.path()))
      ::umount2(place.path().c_str(), MNT_DETACH);
  }
  [[nodiscard]] std::string obstacle() const override {
    if (std::string reason = Tests::enterMountNamespace(); !reason.empty()) return reason;
    return name_.empty() ? "The temporary folder lies on no disk." : "";
  }
  DiskArbitration& port() override { return *disks_; }
  std::string disk() override { return name_; }
  URL mount(const std::string& name) override {
    const fs::path place = folder_.path() / name;
    fs::create_directory(place);
    EXPECT_EQ(::mount(place.c_str(), place.c_str(), nullptr, MS_BIND, nullptr), 0);
    return URL::fileURLWithPath(place.string() + "/");
  }
  void unmount(const URL& folder) override { EXPECT_EQ(::umount(folder.path().c_str()), 0); }
  void loseService() override { isLost_ = Tests::mountMemory("/proc"); }

 private:
  static std::string nameOfDisk(const fs::path& folder) {
    struct stat facts {};
    ::stat(folder.c_str(), &facts);
    const std::string number =
        std::to_string(major(facts.st_dev)) + ':' + std::to_string(minor(facts.st_dev));
    std::error_code isNone;
    return fs::read_symlink("/sys/dev/block/" + number, isNone).filename();
  }

  const Tests::TemporaryFolder folder_;
  const std::string name_ = nameOfDisk(folder_.path());
  const std::unique_ptr<DiskArbitration> disks_ =
      Linux::makeDiskArbitration(Linux::makeMountTable());
  bool isLost_ = false;
};
INSTANTIATE_TEST_SUITE_P(Linux, DiskArbitrationContract, on<BoundFolders>());

class MountedMemory final : public VolumeCatalogWorld {
 public:
  ~MountedMemory() override {
    if (!pseudo_.empty()) ::umount2(pseudo_.c_str(), MNT_DETACH);
  }
  [[nodiscard]] std::string obstacle() const override { return Tests::enterMountNamespace(); }
  VolumeCatalog& port() override { return *catalog_; }
  std::string folder(const std::string& name) override {
    std::filesystem::create_directory(folder_.path() / name);
    return folder_.path() / name;
  }
  void mount(const URL& folder) override { EXPECT_TRUE(Tests::mountMemory(folder.path())); }
  void unmount(const URL& folder) override { EXPECT_EQ(::umount(folder.path().c_str()), 0); }
  void mountPseudo(const URL& folder) override {
    const std::string path = folder.path();
    EXPECT_EQ(::mount("/proc", path.c_str(), nullptr, MS_BIND | MS_REC, nullptr), 0);
    pseudo_ = path;
  }

 private:
  std::string pseudo_;
  const Tests::TemporaryFolder folder_;
  const std::unique_ptr<VolumeCatalog> catalog_ = Linux::makeVolumeCatalog(Linux::makeMountTable());
};
INSTANTIATE_TEST_SUITE_P(Linux, VolumeCatalogContract, on<MountedMemory>());

}  // namespace
}  // namespace Varnel::Platform::Contract
