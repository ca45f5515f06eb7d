// SPDX-License-Identifier: MIT
#include <Tests/Contract/DiskWorlds.h>

#include <gmock/gmock.h>

#include <algorithm>
#include <atomic>
#include <map>
#include <set>
#include <thread>

#include <Varnel/Platform/Testing/FakeDeviceRegistry.h>
#include <Varnel/Platform/Testing/FakeDiskArbitration.h>
#include <Varnel/Platform/Testing/FakeVolumeCatalog.h>

namespace Varnel::Platform::Contract {
namespace {

using ::testing::AllOf;
using ::testing::Contains;
using ::testing::ElementsAre;
using ::testing::Field;
using ::testing::IsEmpty;
using ::testing::Not;

// The serial number or the name of an entry, or "?".
std::string named(const RegistryEntry& entry) {
  const auto name = entry.property("BSD Name");
  if (name) return *name->as<std::string>();
  const auto facts = entry.property("Device Characteristics");
  const auto* dictionary = facts ? facts->as<PropertyDictionary>() : nullptr;
  const auto* serial = dictionary ? findAs<std::string>(*dictionary, "Serial Number") : nullptr;
  return serial ? *serial : "?";
}

std::vector<std::string> named(const DeviceRegistry::Entries& entries) {
  std::vector<std::string> names;
  for (const auto& entry : entries) names.push_back(named(*entry));
  return names;
}

// From the entry up.
std::vector<std::string> pathOf(std::unique_ptr<RegistryEntry> entry) {
  std::vector<std::string> names;
  for (; entry; entry = entry->parent()) names.push_back(named(*entry));
  return names;
}

DeviceRegistry::Entries matching(DeviceRegistry& registry, std::string_view name,
                                 const PropertyValue& value) {
  return registry.entriesMatchingProperty(name, value).value();
}

TEST_P(DeviceRegistryContract, FindsEntriesByTheirOwnPropertiesInItsOrder) {
  DeviceRegistry& registry = world->port();
  EXPECT_THAT(named(matching(registry, "SMART Capable", true)), IsEmpty());
  world->plug("sda", "S1");
  world->plug("sdb", "S2");
  EXPECT_THAT(named(matching(registry, "SMART Capable", true)), ElementsAre("S1", "S2"));
  EXPECT_THAT(named(matching(registry, "BSD Name", "sda1")), ElementsAre("sda1"));
  const std::pair<const char*, PropertyValue> others[] = {
      {"SMART Capable", false}, {"SMART Capable", 1},   {"SMART Capable", "true"},
      {"smart capable", true},  {"BSD Name", "sda1 "},  {"", ""},
      {"BSD Name", nullptr},    {"Serial Number", "S1"}};
  for (const auto& [name, value] : others)
    EXPECT_THAT(named(matching(registry, name, value)), IsEmpty()) << name;
  const auto all = matching(registry, "SMART Capable", true).front()->properties();
  const auto* facts = findAs<PropertyDictionary>(*all, "Device Characteristics");
  EXPECT_EQ(*facts, (PropertyDictionary{{"Medium Type", "Rotational"}, {"Serial Number", "S1"}}));
}

TEST_P(DeviceRegistryContract, LeadsUpToTheDeviceAndDownToAllThatStandsOnIt) {
  DeviceRegistry& registry = world->port();
  world->plug("sda", "S1");
  world->plug("sdb", "S2");
  world->putOn("md0", {"sda1", "sdb1"});
  const auto devices = matching(registry, "SMART Capable", true);
  for (const std::size_t i : {0u, 1u}) {
    const std::string disk = i == 0 ? "sda" : "sdb";
    const auto disks = devices[i]->children();
    EXPECT_THAT(named(disks), ElementsAre(disk));
    EXPECT_THAT(named(disks.front()->children()), ElementsAre(disk + "1"));
    EXPECT_THAT(named(disks.front()->children().front()->children()), ElementsAre("md0"));
  }
  EXPECT_THAT(pathOf(std::move(matching(registry, "BSD Name", "sdb1").front())),
              ElementsAre("sdb1", "sdb", "S2"));
  EXPECT_THAT(pathOf(std::move(matching(registry, "BSD Name", "md0").front())),
              ElementsAre("md0", "sda1", "sda", "S1"));
}

TEST_P(DeviceRegistryContract, AnEntryShowsTheRegistryOfItsLookUp) {
  DeviceRegistry& registry = world->port();
  world->plug("sda", "S1");
  auto partition = std::move(matching(registry, "BSD Name", "sda1").front());
  const auto disk = partition->parent();
  world->unplug("sda");
  EXPECT_TRUE(disk->properties());
  EXPECT_THAT(named(disk->children()), ElementsAre("sda1"));
  EXPECT_THAT(pathOf(std::move(partition)), ElementsAre("sda1", "sda", "S1"));
  EXPECT_THAT(matching(registry, "BSD Name", "sda"), IsEmpty());
  EXPECT_THAT(matching(registry, "SMART Capable", true), IsEmpty());
}

class FakeDeviceRegistryWorld final
    : public FakeColumn<DeviceRegistryWorld, Testing::FakeDeviceRegistry> {
 public:
  void plug(const std::string& name, const std::string& serial) override {
    const PropertyDictionary facts{{"Medium Type", "Rotational"}, {"Serial Number", serial}};
    const auto device = port_.plug({{"SMART Capable", true}, {"Device Characteristics", facts}});
    const auto disk = port_.plug({{"BSD Name", name}}, device);
    partitions_[name + "1"] = port_.plug({{"BSD Name", name + "1"}}, disk);
    devices_[name] = device;
  }
  void unplug(const std::string& name) override { port_.unplug(devices_.at(name)); }
  void putOn(const std::string& name, const std::vector<std::string>& lower) override {
    const auto device = port_.plug({{"BSD Name", name}}, partitions_.at(lower.front()));
    for (std::size_t i = 1; i < lower.size(); ++i) port_.attach(device, partitions_.at(lower[i]));
  }

 private:
  std::map<std::string, Testing::FakeDeviceRegistry::Device> devices_, partitions_;
};
INSTANTIATE_TEST_SUITE_P(Fake, DeviceRegistryContract, on<FakeDeviceRegistryWorld>());

TEST_P(DiskArbitrationContract, ASessionKnowsEveryPlaceOfADiskAsItWasWhenTheSessionBegan) {
  DiskArbitration& disks = world->port();
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
  EXPECT_EQ(world->port().openSession(), nullptr);
}

class FakeDiskArbitrationWorld final
    : public FakeColumn<DiskArbitrationWorld, Testing::FakeDiskArbitration> {
 public:
  std::string disk() override { return "sda1"; }
  URL mount(const std::string& name) override {
    places_.push_back(URL::fileURLWithPath("/media/" + name + "/"));
    port_.setMountURLs(disk(), places_);
    return places_.back();
  }
  void unmount(const URL& folder) override {
    std::erase(places_, folder);
    port_.setMountURLs(disk(), places_);
  }
  void loseService() override { port_.setReachable(false); }

 private:
  std::vector<URL> places_;
};
INSTANTIATE_TEST_SUITE_P(Fake, DiskArbitrationContract, on<FakeDiskArbitrationWorld>());

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
  for (const MountedVolume& volume : world->port().mountedVolumes()) {
    EXPECT_TRUE(volume.url.hasDirectoryPath());
    EXPECT_TRUE(urls.insert(volume.url).second) << volume.url.absoluteString();
  }
  EXPECT_THAT(urls, Contains(URL::fileURLWithPath("/")));
}

TEST_P(VolumeCatalogContract, FindsTheVolumeOfAPathAsMountsComeAndGo) {
  VolumeCatalog& catalog = world->port();
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
  Listener first(world->port(), url);
  Listener second(world->port(), url);
  auto subscription = world->port().subscribe(first.handler());
  const auto other = world->port().subscribe(second.handler());
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
  VolumeCatalog& catalog = world->port();
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

TEST_P(VolumeCatalogContract, TellsPseudoFileSystemsFromVolumes) {
  VolumeCatalog& catalog = world->port();
  const URL url = volumeAt(world->folder("kernel"));
  EXPECT_THAT(catalog.pseudoFileSystems(), Not(Contains(url)));
  world->mountPseudo(url);
  EXPECT_THAT(catalog.pseudoFileSystems(), Contains(url));
  EXPECT_THAT(catalog.mountedVolumes(), Not(Contains(Field(&MountedVolume::url, url))));
  EXPECT_EQ(catalog.volumeURL(url).value(), std::nullopt);
}

TEST_P(VolumeCatalogContract, APathThatIsNoneCannotBeLookedUp) {
  for (const std::string& path : {std::string(), std::string("/\0/x", 4)})
    EXPECT_FALSE(world->port().volumeURL(URL::fileURLWithPath(path))) << path;
}

TEST_P(VolumeCatalogContract, TheEndOfASubscriptionWaitsForItsHandler) {
  const URL url = volumeAt(world->folder("volume"));
  std::atomic<bool> hasBegun = false;
  std::atomic<bool> isEnding = false;
  std::atomic<bool> hasReturned = false;
  auto subscription = world->port().subscribe([&](const VolumeChange&) {
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

class FakeVolumeCatalogWorld final
    : public FakeColumn<VolumeCatalogWorld, Testing::FakeVolumeCatalog> {
 public:
  FakeVolumeCatalogWorld() { port_.setVolumes({{URL::fileURLWithPath("/"), true, true, {}}}); }
  std::string folder(const std::string& name) override { return "/media/" + name; }
  void mount(const URL& folder) override { port_.mount({folder, true, {}, {}}); }
  void unmount(const URL& folder) override { port_.unmount(folder); }
  void mountPseudo(const URL& folder) override { port_.setPseudoFileSystems({folder}); }
};
INSTANTIATE_TEST_SUITE_P(Fake, VolumeCatalogContract, on<FakeVolumeCatalogWorld>());

}  // namespace
}  // namespace Varnel::Platform::Contract
