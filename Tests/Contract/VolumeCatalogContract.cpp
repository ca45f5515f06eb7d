// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>

#include <atomic>
#include <set>

#include <Tests/Support/MountNamespace.h>
#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Platform/Linux/Adapters.h>
#include <Varnel/Platform/Linux/Disks/MountTable.h>
#include <Varnel/Platform/Testing/FakeVolumeCatalog.h>

namespace Varnel::Platform {
namespace {

using testing::Contains;
using testing::Field;
using testing::Not;

/// A catalogue whose machine a test can change.
class Subject {
 public:
  virtual ~Subject() = default;
  virtual VolumeCatalog& catalog() = 0;
  virtual void mount(const URL& folder) = 0;
  virtual void unmount(const URL& folder) = 0;
};

class FakeSubject final : public Subject {
 public:
  FakeSubject() { catalog_.setVolumes({{URL::fileURLWithPath("/"), true, true, {}}}); }
  VolumeCatalog& catalog() override { return catalog_; }
  void mount(const URL& folder) override { catalog_.mount({folder, true, {}, {}}); }
  void unmount(const URL& folder) override { catalog_.unmount(folder); }

 private:
  Testing::FakeVolumeCatalog catalog_;
};

class LinuxSubject final : public Subject {
 public:
  VolumeCatalog& catalog() override { return *catalog_; }
  void mount(const URL& folder) override { ASSERT_TRUE(Tests::mountMemory(folder.path())); }
  void unmount(const URL& folder) override { ASSERT_EQ(::umount(folder.path().c_str()), 0); }

 private:
  const std::unique_ptr<VolumeCatalog> catalog_ = Linux::makeVolumeCatalog(Linux::makeMountTable());
};

/// Collects the changes of one volume, and what the catalogue showed when they were told.
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

template <typename Type>
class VolumeCatalogContract : public testing::Test {
 protected:
  void SetUp() override {
    if (!std::is_same_v<Type, LinuxSubject>) return;
    const std::string reason = Tests::enterMountNamespace();
    if (!reason.empty()) GTEST_SKIP() << reason;
  }

  URL folder(const std::string& name) {
    std::filesystem::create_directories(folder_.path() / name);
    return URL::fileURLWithPath((folder_.path() / name).string() + "/");
  }

  Tests::TemporaryFolder folder_;
};

using Subjects = testing::Types<FakeSubject, LinuxSubject>;
TYPED_TEST_SUITE(VolumeCatalogContract, Subjects);

TYPED_TEST(VolumeCatalogContract, ListsEachVolumeOnceAsAFolder) {
  TypeParam subject;
  std::set<URL> urls;
  for (const MountedVolume& volume : subject.catalog().mountedVolumes()) {
    EXPECT_TRUE(volume.url.hasDirectoryPath());
    EXPECT_TRUE(urls.insert(volume.url).second) << volume.url.absoluteString();
  }
  EXPECT_THAT(urls, Contains(URL::fileURLWithPath("/")));
}

TYPED_TEST(VolumeCatalogContract, FindsTheVolumeOfAPathAsMountsComeAndGo) {
  TypeParam subject;
  VolumeCatalog& catalog = subject.catalog();
  const URL inner = this->folder("a folder");
  const URL root = *catalog.volumeURL(URL::fileURLWithPath(this->folder_.path().string())).value();
  EXPECT_EQ(catalog.volumeURL(inner).value(), root);
  EXPECT_EQ(catalog.volumeName(inner), std::nullopt);

  subject.mount(inner);
  EXPECT_EQ(catalog.volumeURL(inner).value(), inner);
  EXPECT_EQ(catalog.volumeURL(URL::fileURLWithPath(inner.path())).value(), inner);
  EXPECT_EQ(catalog.volumeName(inner), "a folder");
  EXPECT_THAT(catalog.mountedVolumes(), Contains(Field(&MountedVolume::url, inner)));

  subject.unmount(inner);
  EXPECT_EQ(catalog.volumeURL(inner).value(), root);
  EXPECT_THAT(catalog.mountedVolumes(), Not(Contains(Field(&MountedVolume::url, inner))));
}

TYPED_TEST(VolumeCatalogContract, TellsOfAChangeOnceTheListShowsIt) {
  TypeParam subject;
  const URL url = this->folder("volume");
  Listener first(subject.catalog(), url);
  Listener second(subject.catalog(), url);
  auto subscription = subject.catalog().subscribe(first.handler());
  const auto other = subject.catalog().subscribe(second.handler());
  ASSERT_TRUE(subscription && other);

  subject.mount(url);
  first.waitUntilTold(1);
  second.waitUntilTold(1);
  subject.unmount(url);
  first.waitUntilTold(2);
  second.waitUntilTold(2);  // or it might see no change between this mount and the next

  subscription.reset();
  subject.mount(url);
  second.waitUntilTold(3);
  subject.unmount(url);
  second.waitUntilTold(4);
  EXPECT_EQ(first.told, 2) << "a subscription that has ended hears nothing";
  EXPECT_TRUE(first.isConsistent);
  EXPECT_TRUE(second.isConsistent);
}

}  // namespace
}  // namespace Varnel::Platform
