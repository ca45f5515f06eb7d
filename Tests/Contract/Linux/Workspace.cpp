// SPDX-License-Identifier: MIT
#include <Tests/Contract/WorkspaceContract.h>

#include <glib.h>
#include <stdlib.h>

#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Platform/Linux/Adapters.h>

namespace Varnel::Platform::Contract {
namespace {

namespace fs = std::filesystem;

// The folders of desktop entries are read once a process.
class LinuxWorld final : public WorkspaceWorld {
 public:
  LinuxWorld() {
    ::setenv("XDG_DATA_HOME", (folder_.path() / "user").c_str(), 1);
    ::setenv("XDG_DATA_DIRS", (folder_.path() / "system").c_str(), 1);
  }
  [[nodiscard]] std::string obstacle() const override {
    return g_get_user_data_dir() == folder_.path() / "user" ? "" : "A process can do this once.";
  }
  Workspace& workspace() override { return *workspace_; }
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
  const std::unique_ptr<Workspace> workspace_ = Linux::makeWorkspace();
};

INSTANTIATE_TEST_SUITE_P(Linux, WorkspaceContract, WorkspaceContract::on<LinuxWorld>());

}  // namespace
}  // namespace Varnel::Platform::Contract
