// SPDX-License-Identifier: MIT
#include <Tests/Contract/UserWorlds.h>

#include <glib.h>
#include <stdlib.h>

#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Platform/Linux/Adapters.h>

namespace Varnel::Platform::Contract {
namespace {

namespace fs = std::filesystem;

// A machine made of files.
class MachineOfFiles final : public MachineIdentityWorld {
 public:
  MachineIdentity& port() override { return *machine_; }
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
INSTANTIATE_TEST_SUITE_P(Linux, MachineIdentityContract, on<MachineOfFiles>());

// The folders of desktop entries are read once a process.
class DesktopEntries final : public AdapterColumn<WorkspaceWorld, Linux::makeWorkspace> {
 public:
  DesktopEntries() {
    ::setenv("XDG_DATA_HOME", (folder_.path() / "user").c_str(), 1);
    ::setenv("XDG_DATA_DIRS", (folder_.path() / "system").c_str(), 1);
  }
  [[nodiscard]] std::string obstacle() const override {
    return g_get_user_data_dir() == folder_.path() / "user" ? "" : "A process can do this once.";
  }
  URL install(const std::string& identifier, bool hasBundle) override {
    const fs::path program = folder_.write(fs::path(identifier) / "app", "");
    fs::permissions(program, fs::perms::owner_all);
    if (hasBundle) folder_.write(fs::path(identifier) / "Info.plist", "");
    folder_.write(entry(identifier), "[Desktop Entry]\nType=Application\nName=App\nExec=\"" +
                                         program.string() + "\"\n");
    return URL::fileURLWithPath(hasBundle ? program.parent_path().string() + "/"
                                          : program.string());
  }
  void remove(const std::string& identifier) override {
    fs::remove(folder_.path() / entry(identifier));
  }

 private:
  static fs::path entry(const std::string& identifier) {
    return "user/applications/" + identifier + ".desktop";
  }

  const Tests::TemporaryFolder folder_;
};
INSTANTIATE_TEST_SUITE_P(Linux, WorkspaceContract, on<DesktopEntries>());

}  // namespace
}  // namespace Varnel::Platform::Contract
