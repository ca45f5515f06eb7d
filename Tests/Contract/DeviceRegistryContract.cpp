// SPDX-License-Identifier: MIT
#include <Tests/Contract/DiskWorlds.h>

#include <gmock/gmock.h>

#include <map>

#include <Varnel/Platform/Testing/FakeDeviceRegistry.h>

namespace Varnel::Platform::Contract {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;

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
  DeviceRegistry& registry = world->registry();
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
  DeviceRegistry& registry = world->registry();
  world->plug("sda", "S1");
  world->plug("sdb", "S2");
  world->putOn("md0", {"sda1", "sdb1"});
  const auto devices = matching(registry, "SMART Capable", true);
  for (const std::size_t i : {0, 1}) {
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
  DeviceRegistry& registry = world->registry();
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

class FakeWorld final : public DeviceRegistryWorld {
 public:
  DeviceRegistry& registry() override { return registry_; }
  void plug(const std::string& name, const std::string& serial) override {
    const PropertyDictionary facts{{"Medium Type", "Rotational"}, {"Serial Number", serial}};
    const auto device =
        registry_.plug({{"SMART Capable", true}, {"Device Characteristics", facts}});
    const auto disk = registry_.plug({{"BSD Name", name}}, device);
    partitions_[name + "1"] = registry_.plug({{"BSD Name", name + "1"}}, disk);
    devices_[name] = device;
  }
  void unplug(const std::string& name) override { registry_.unplug(devices_.at(name)); }
  void putOn(const std::string& name, const std::vector<std::string>& lower) override {
    const auto device = registry_.plug({{"BSD Name", name}}, partitions_.at(lower.front()));
    for (std::size_t i = 1; i < lower.size(); ++i)
      registry_.attach(device, partitions_.at(lower[i]));
  }

 private:
  Testing::FakeDeviceRegistry registry_;
  std::map<std::string, Testing::FakeDeviceRegistry::Device> devices_, partitions_;
};

INSTANTIATE_TEST_SUITE_P(Fake, DeviceRegistryContract, DeviceRegistryContract::on<FakeWorld>());

}  // namespace
}  // namespace Varnel::Platform::Contract
