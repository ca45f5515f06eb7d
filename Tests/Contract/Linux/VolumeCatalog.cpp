// SPDX-License-Identifier: MIT
#include <Tests/Contract/VolumeCatalogContract.h>

#include <Tests/Support/MountNamespace.h>
#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Platform/Linux/Adapters.h>
#include <Varnel/Platform/Linux/Disks/MountTable.h>

namespace Varnel::Platform::Contract {
namespace {

class LinuxWorld final : public VolumeCatalogWorld {
 public:
  [[nodiscard]] std::string obstacle() const override { return Tests::enterMountNamespace(); }
  VolumeCatalog& catalog() override { return *catalog_; }
  std::string folder(const std::string& name) override {
    std::filesystem::create_directory(folder_.path() / name);
    return folder_.path() / name;
  }
  void mount(const URL& folder) override { EXPECT_TRUE(Tests::mountMemory(folder.path())); }
  void unmount(const URL& folder) override { EXPECT_EQ(::umount(folder.path().c_str()), 0); }

 private:
  const Tests::TemporaryFolder folder_;
  const std::unique_ptr<VolumeCatalog> catalog_ = Linux::makeVolumeCatalog(Linux::makeMountTable());
};

INSTANTIATE_TEST_SUITE_P(Linux, VolumeCatalogContract, VolumeCatalogContract::on<LinuxWorld>());

}  // namespace
}  // namespace Varnel::Platform::Contract
