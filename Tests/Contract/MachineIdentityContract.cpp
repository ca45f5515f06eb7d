// SPDX-License-Identifier: MIT
#include <Tests/Contract/UserWorlds.h>

#include <gmock/gmock.h>

#include <Varnel/Platform/Testing/FakeMachineIdentity.h>

namespace Varnel::Platform::Contract {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;

TEST_P(MachineIdentityContract, TellsTextsOrNothingUnderExactlyTheirNames) {
  const MachineIdentity& machine = world->machine();
  const auto properties = [&] {
    return std::pair(machine.platformProperty("IOPlatformUUID"),
                     machine.platformProperty("IOPlatformSerialNumber"));
  };
  const auto nothing = std::pair(std::optional<PropertyValue>(), std::optional<PropertyValue>());
  EXPECT_EQ(properties(), nothing);
  const PropertyValue uuid = "3d1219c7c4c5404aaa1f6d2a48adfda4";
  const PropertyValue serial = "5CD1234XYZ";
  world->identify(*uuid.as<std::string>(), *serial.as<std::string>());
  EXPECT_EQ(properties(), std::pair(std::optional(uuid), std::optional(serial)));
  EXPECT_EQ(properties(), std::pair(std::optional(uuid), std::optional(serial))) << "each time";
  for (const char* other : {"ioplatformuuid", "UUID", "IOPlatform", ""})
    EXPECT_EQ(machine.platformProperty(other), std::nullopt) << other;
  world->identify("", "");
  EXPECT_EQ(properties(), nothing) << "an empty text is none";
}

TEST_P(MachineIdentityContract, ListsNoInterfaceWithoutAnAddress) {
  const MachineIdentity& machine = world->machine();
  EXPECT_THAT(machine.primaryInterfaceAddresses(), IsEmpty());
  const PropertyData address{std::byte{2}, std::byte{0}, std::byte{0},
                             std::byte{0}, std::byte{0}, std::byte{9}};
  world->connect(address);
  EXPECT_THAT(machine.primaryInterfaceAddresses(), ElementsAre(address));
  world->connect({});
  EXPECT_THAT(machine.primaryInterfaceAddresses(), IsEmpty());
}

class FakeWorld final : public MachineIdentityWorld {
 public:
  FakeWorld() { machine_.properties.clear(); }
  MachineIdentity& machine() override { return machine_; }
  void identify(const std::string& uuid, const std::string& serial) override {
    machine_.properties = {{"IOPlatformUUID", uuid}, {"IOPlatformSerialNumber", serial}};
  }
  void connect(const PropertyData& address) override { machine_.addresses = {address}; }

 private:
  Testing::FakeMachineIdentity machine_;
};

INSTANTIATE_TEST_SUITE_P(Fake, MachineIdentityContract, MachineIdentityContract::on<FakeWorld>());

}  // namespace
}  // namespace Varnel::Platform::Contract
