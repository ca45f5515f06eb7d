// SPDX-License-Identifier: MIT
#include <Tests/Contract/DiskWorlds.h>

#include <gmock/gmock.h>

#include <algorithm>

#include <Varnel/Platform/Testing/FakeDiskArbitration.h>

namespace Varnel::Platform::Contract {
namespace {

using ::testing::AllOf;
using ::testing::Contains;
using ::testing::IsEmpty;
using ::testing::Not;

TEST_P(DiskArbitrationContract, ASessionKnowsEveryPlaceOfADiskAsItWasWhenTheSessionBegan) {
  DiskArbitration& disks = world->disks();
  const std::string disk = world->disk();
  const auto before = disks.openSession();
  const URL first = world->mount("first place");
  const URL second = world->mount("second");
  EXPECT_TRUE(first.hasDirectoryPath());
  const auto between = disks.openSession();
  world->unmount(first);
  const auto after = disks.openSession();

  EXPECT_THAT(before->mountURLs(disk), Not(Contains(first)));
  EXPECT_THAT(between->mountURLs(disk), AllOf(Contains(first), Contains(second)));
  EXPECT_THAT(after->mountURLs(disk), AllOf(Not(Contains(first)), Contains(second)));
  for (const std::string& other : {"/dev/" + disk, disk + "0", std::string("none"), std::string()})
    EXPECT_THAT(between->mountURLs(other), IsEmpty()) << other;
}

TEST_P(DiskArbitrationContract, AServiceOutOfReachOpensNoSession) {
  world->loseService();
  EXPECT_EQ(world->disks().openSession(), nullptr);
}

class FakeWorld final : public DiskArbitrationWorld {
 public:
  DiskArbitration& disks() override { return disks_; }
  std::string disk() override { return "sda1"; }
  URL mount(const std::string& name) override {
    places_.push_back(URL::fileURLWithPath("/media/" + name + "/"));
    disks_.setMountURLs(disk(), places_);
    return places_.back();
  }
  void unmount(const URL& folder) override {
    std::erase(places_, folder);
    disks_.setMountURLs(disk(), places_);
  }
  void loseService() override { disks_.setReachable(false); }

 private:
  Testing::FakeDiskArbitration disks_;
  std::vector<URL> places_;
};

INSTANTIATE_TEST_SUITE_P(Fake, DiskArbitrationContract, DiskArbitrationContract::on<FakeWorld>());

}  // namespace
}  // namespace Varnel::Platform::Contract
