// SPDX-License-Identifier: MIT
#include <Tests/Contract/DiskWorlds.h>

#include <gmock/gmock.h>

#include <algorithm>
#include <atomic>
#include <set>
#include <thread>

#include <Varnel/Platform/Testing/FakeVolumeCatalog.h>

namespace Varnel::Platform::Contract {
namespace {

using testing::Contains;
using testing::Field;
using testing::Not;

URL volumeAt(const std::string& path) {
  return URL::fileURLWithPath(path + "/");
}

// Collects the changes of one volume, and what the catalogue showed when they were told.
class Listener {
 public:
  Listener(VolumeCatalog& catalog, URL url) : catalog_(catalog), url_(std::move(url)) {}

  VolumeCatalog::ChangeHandler handler() {
    return [this](const VolumeChange& change) {
      if (change.volumeURL != url_) return;
      const bool isListed = catalog_.volumeName(url_).has_value();
      if (isListed != (change.kind == VolumeChange::Kind::mounted)) isConsistent = false;
      ++told;
      told.notify_all();
    };
  }

  void waitUntilTold(int count) {
    for (int before; (before = told) < count;) told.wait(before);
  }

  std::atomic<int> told = 0;
  std::atomic<bool> isConsistent = true;

 private:
  VolumeCatalog& catalog_;
  const URL url_;
};

TEST_P(VolumeCatalogContract, ListsEachVolumeOnceAsAFolder) {
  std::set<URL> urls;
  for (const MountedVolume& volume : world->catalog().mountedVolumes()) {
    EXPECT_TRUE(volume.url.hasDirectoryPath());
    EXPECT_TRUE(urls.insert(volume.url).second) << volume.url.absoluteString();
  }
  EXPECT_THAT(urls, Contains(URL::fileURLWithPath("/")));
}

TEST_P(VolumeCatalogContract, FindsTheVolumeOfAPathAsMountsComeAndGo) {
  VolumeCatalog& catalog = world->catalog();
  const URL inner = volumeAt(world->folder("a folder"));
  const URL root = *catalog.volumeURL(inner).value();
  EXPECT_NE(root, inner);
  EXPECT_EQ(catalog.volumeName(inner), std::nullopt);

  world->mount(inner);
  EXPECT_EQ(catalog.volumeURL(inner).value(), inner);
  EXPECT_EQ(catalog.volumeURL(URL::fileURLWithPath(inner.path())).value(), inner);
  EXPECT_EQ(catalog.volumeName(inner), "a folder");
  EXPECT_THAT(catalog.mountedVolumes(), Contains(Field(&MountedVolume::url, inner)));

  world->unmount(inner);
  EXPECT_EQ(catalog.volumeURL(inner).value(), root);
  EXPECT_THAT(catalog.mountedVolumes(), Not(Contains(Field(&MountedVolume::url, inner))));
}

TEST_P(VolumeCatalogContract, TellsOfAChangeOnceTheListShowsIt) {
  const URL url = volumeAt(world->folder("volume"));
  Listener first(world->catalog(), url);
  Listener second(world->catalog(), url);
  auto subscription = world->catalog().subscribe(first.handler());
  const auto other = world->catalog().subscribe(second.handler());
  ASSERT_TRUE(subscription && other);

  world->mount(url);
  first.waitUntilTold(1);
  second.waitUntilTold(1);
  world->unmount(url);
  first.waitUntilTold(2);
  second.waitUntilTold(2);  // or it might see no change between this mount and the next

  subscription.reset();
  world->mount(url);
  second.waitUntilTold(3);
  world->unmount(url);
  second.waitUntilTold(4);
  EXPECT_EQ(first.told, 2) << "a subscription that has ended hears nothing";
  EXPECT_TRUE(first.isConsistent);
  EXPECT_TRUE(second.isConsistent);
}

TEST_P(VolumeCatalogContract, AVolumeOverAnotherHidesItUntilItGoes) {
  VolumeCatalog& catalog = world->catalog();
  const URL url = volumeAt(world->folder("volume"));
  const auto count = [&] {
    const auto volumes = catalog.mountedVolumes();
    return std::count_if(volumes.begin(), volumes.end(),
                         [&](const MountedVolume& volume) { return volume.url == url; });
  };
  for (int i = 0; i < 2; ++i) {
    world->mount(url);
    EXPECT_EQ(count(), 1);
  }
  world->unmount(url);
  EXPECT_EQ(count(), 1);
  world->unmount(url);
  EXPECT_EQ(count(), 0);
}

TEST_P(VolumeCatalogContract, APathThatIsNoneCannotBeLookedUp) {
  for (const std::string& path : {std::string(), std::string("/\0/x", 4)})
    EXPECT_FALSE(world->catalog().volumeURL(URL::fileURLWithPath(path))) << path;
}

TEST_P(VolumeCatalogContract, TheEndOfASubscriptionWaitsForItsHandler) {
  const URL url = volumeAt(world->folder("volume"));
  std::atomic<bool> hasBegun = false;
  std::atomic<bool> isEnding = false;
  std::atomic<bool> hasReturned = false;
  auto subscription = world->catalog().subscribe([&](const VolumeChange&) {
    if (hasBegun.exchange(true)) return;
    hasBegun.notify_all();
    isEnding.wait(false);
    for (int i = 0; i < 1000; ++i) std::this_thread::yield();
    hasReturned = true;
  });
  {
    const std::jthread changer([&] { world->mount(url); });
    hasBegun.wait(false);
    isEnding = true;
    isEnding.notify_all();
    subscription.reset();
    EXPECT_TRUE(hasReturned);
  }
  world->unmount(url);
}

class FakeWorld final : public VolumeCatalogWorld {
 public:
  FakeWorld() { catalog_.setVolumes({{URL::fileURLWithPath("/"), true, true, {}}}); }
  VolumeCatalog& catalog() override { return catalog_; }
  std::string folder(const std::string& name) override { return "/media/" + name; }
  void mount(const URL& folder) override { catalog_.mount({folder, true, {}, {}}); }
  void unmount(const URL& folder) override { catalog_.unmount(folder); }

 private:
  Testing::FakeVolumeCatalog catalog_;
};

INSTANTIATE_TEST_SUITE_P(Fake, VolumeCatalogContract, VolumeCatalogContract::on<FakeWorld>());

}  // namespace
}  // namespace Varnel::Platform::Contract
