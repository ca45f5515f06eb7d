// SPDX-License-Identifier: MIT
#include <Tests/Contract/MachineIdentityContract.h>

#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Platform/Linux/Adapters.h>

namespace Varnel::Platform::Contract {
namespace {

// A machine made of files.
class LinuxWorld final : public MachineIdentityWorld {
 public:
  MachineIdentity& machine() override { return *machine_; }
  void identify(const std::string& uuid, const std::string& serial) override {
    folder_.write("etc/machine-id", uuid + "\n");
    folder_.write("sys/class/dmi/id/product_serial", serial + "\n");
  }
  void connect(const PropertyData& address) override {
    constexpr char digits[] = "0123456789abcdef";
    std::string text;
    for (const std::byte byte : address) {
      if (!text.empty()) text += ':';
      const auto value = std::to_integer<unsigned>(byte);
      text.append({digits[value / 16], digits[value % 16]});
    }
    folder_.write("sys/class/net/eth0/type", "1\n");
    folder_.write("sys/class/net/eth0/address", text + "\n");
    folder_.write("sys/class/net/eth0/device/vendor", "0x8086\n");
    folder_.write("proc/net/route", "eth0\t00000000\t0101A8C0\t0003\t0\t0\t0\t00000000\t0\t0\t0\n");
  }

 private:
  const Tests::TemporaryFolder folder_;
  const std::unique_ptr<MachineIdentity> machine_ = Linux::makeMachineIdentity(folder_.path());
};

INSTANTIATE_TEST_SUITE_P(Linux, MachineIdentityContract, MachineIdentityContract::on<LinuxWorld>());

}  // namespace
}  // namespace Varnel::Platform::Contract
