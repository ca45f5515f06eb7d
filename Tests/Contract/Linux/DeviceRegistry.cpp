// SPDX-License-Identifier: MIT
#include <Tests/Contract/DeviceRegistryContract.h>
#include <Tests/Support/SysfsMachine.h>
#include <Varnel/Platform/Linux/Adapters.h>

namespace Varnel::Platform::Contract {
namespace {

class LinuxWorld final : public DeviceRegistryWorld {
 public:
  DeviceRegistry& registry() override { return *registry_; }
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

INSTANTIATE_TEST_SUITE_P(Linux, DeviceRegistryContract, DeviceRegistryContract::on<LinuxWorld>());

}  // namespace
}  // namespace Varnel::Platform::Contract
