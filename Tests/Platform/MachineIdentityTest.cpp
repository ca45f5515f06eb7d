// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Ports/MachineIdentity.h>

#include <gmock/gmock.h>

#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Platform/Linux/Adapters.h>
#include <Varnel/Platform/Linux/Identity/DefaultRoutes.h>

namespace Varnel::Platform::Linux {
namespace {

namespace fs = std::filesystem;
using testing::ElementsAre;

// A machine made of files. Interface N has the address 02:00:00:00:00:N.
class MockedMachine : public testing::Test {
 protected:
  void addInterface(const std::string& name, int number, const char* type = "1") {
    const std::string base = "sys/class/net/" + name + "/";
    folder.write(base + "type", std::string(type) + "\n");
    folder.write(base + "address", "02:00:00:00:00:0" + std::to_string(number) + "\n");
  }
  void addPhysical(const std::string& name, int number, const char* type = "1") {
    addInterface(name, number, type);
    folder.write("sys/class/net/" + name + "/device/vendor", "0x8086\n");
  }
  void putBelow(const std::string& upper, const std::string& lower) {
    fs::create_symlink("../" + lower, folder.path() / "sys/class/net" / upper / ("lower_" + lower));
  }

  void setRoutes(const std::vector<std::pair<std::string, int>>& ipv4,
                 const std::vector<std::pair<std::string, std::string>>& ipv6 = {}) {
    std::string table = "Iface\tDestination\tGateway\tFlags\tRefCnt\tUse\tMetric\tMask\t\tMTU\n";
    for (const auto& [name, metric] : ipv4)
      table += name + "\t00000000\t0101A8C0\t0003\t0\t0\t" + std::to_string(metric) +
               "\t00000000\t0\t0\t0\n";
    folder.write("proc/net/route", table);
    const std::string none(32, '0');
    table.clear();
    for (const auto& [name, metric] : ipv6)
      table += none + " 00 " + none + " 00 fe800000000000000000000000000001 " + metric +
               " 00000001 00000000 00000003 " + name + "\n";
    folder.write("proc/net/ipv6_route", table);
  }

  // The number of the primary interface, 0 when there is none.
  int primary() {
    const auto addresses = machine->primaryInterfaceAddresses();
    EXPECT_LE(addresses.size(), 1U);
    return addresses.empty() ? 0 : static_cast<int>(addresses.front().back());
  }
  std::string property(const char* name) {
    const auto value = machine->platformProperty(name);
    return value ? *value->as<std::string>() : "none";
  }

  const Tests::TemporaryFolder folder;
  const std::unique_ptr<MachineIdentity> machine = makeMachineIdentity(folder.path().string());
};

TEST_F(MockedMachine, TheMachineIDComesBeforeTheBoardsUUID) {
  const auto uuid = [&] { return property("IOPlatformUUID"); };
  EXPECT_EQ(uuid(), "none");
  folder.write("sys/class/dmi/id/product_uuid", "4C4C4544-0042-3510-8054-B4C04F4A4432\n");
  EXPECT_EQ(uuid(), "4C4C4544-0042-3510-8054-B4C04F4A4432");
  for (const char* unusable : {"", "uninitialized\n", "00000000000000000000000000000000\n",
                               "3d1219c7c4c5404aaa1f6d2a48adfda\n", "../../../../etc/passwd"}) {
    folder.write("etc/machine-id", unusable);
    EXPECT_EQ(uuid(), "4C4C4544-0042-3510-8054-B4C04F4A4432") << unusable;
  }
  folder.write("etc/machine-id", "3d1219c7c4c5404aaa1f6d2a48adfda4\n");
  EXPECT_EQ(uuid(), "3d1219c7c4c5404aaa1f6d2a48adfda4");
}

TEST_F(MockedMachine, PlaceholdersOfTheBoardAreNoIdentity) {
  for (const char* text :
       {"To Be Filled By O.E.M.\n", "Default string", "System Serial Number", "0", "00000000",
        "xxxxxxx", "None", "  \n", "", "Not Specified", "123456789", "........"}) {
    folder.write("sys/class/dmi/id/product_serial", text);
    EXPECT_EQ(property("IOPlatformSerialNumber"), "none") << text;
  }
  folder.write("sys/class/dmi/id/product_serial", "  5CD1234XYZ \n");
  EXPECT_EQ(property("IOPlatformSerialNumber"), "5CD1234XYZ");
  for (const char* text :
       {"00000000-0000-0000-0000-000000000000", "FFFFFFFF-FFFF-FFFF-FFFF-FFFFFFFFFFFF",
        "03000200-0400-0500-0006-000700080009"}) {
    folder.write("sys/class/dmi/id/product_uuid", text);
    EXPECT_EQ(property("IOPlatformUUID"), "none") << text;
  }
}

TEST_F(MockedMachine, ThePrimaryInterfaceHasTheBestDefaultRoute) {
  EXPECT_EQ(primary(), 0);
  addPhysical("eth0", 1);
  addPhysical("wlan0", 2);
  EXPECT_EQ(primary(), 0);
  setRoutes({{"eth0", 600}, {"wlan0", 100}});
  EXPECT_EQ(primary(), 2);
  setRoutes({{"wlan0", 100}, {"eth0", 100}});
  EXPECT_EQ(primary(), 2);
  setRoutes({{"wlan0", 600}}, {{"eth0", "00000064"}});
  EXPECT_EQ(primary(), 1);
  setRoutes({{"wlan0", 100}}, {{"eth0", "00000064"}});
  EXPECT_EQ(primary(), 2);
  setRoutes({}, {{"eth0", "00000400"}});
  EXPECT_EQ(primary(), 1);
  // A table that opens but cannot be read leaves the other.
  fs::remove(folder.path() / "proc/net/route");
  fs::create_directory(folder.path() / "proc/net/route");
  EXPECT_EQ(primary(), 1);
}

TEST_F(MockedMachine, AVirtualInterfaceGivesThePhysicalOneBelowOrNext) {
  addPhysical("eth0", 1);
  addPhysical("eth1", 2);
  addPhysical("wwan0", 3, "65534");  // no Ethernet
  addInterface("tun0", 4, "65534");
  addInterface("br0", 5);
  addInterface("bond0", 6);
  addInterface("veth7", 7);
  putBelow("br0", "veth7");
  putBelow("br0", "bond0");
  putBelow("bond0", "eth1");
  putBelow("veth7", "br0");  // a circle
  setRoutes({{"tun0", 10}, {"wwan0", 20}, {"br0", 50}, {"eth0", 100}});
  EXPECT_EQ(primary(), 2);
  // Members of a bond show its address; their own is kept beside it.
  folder.write("sys/class/net/eth1/bonding_slave/perm_hwaddr", "02:00:00:00:00:09\n");
  EXPECT_EQ(primary(), 9);
  setRoutes({{"tun0", 10}, {"veth8", 20}, {"../eth1", 30}, {"eth0", 100}});
  EXPECT_EQ(primary(), 1);
  setRoutes({{"tun0", 10}});
  EXPECT_EQ(primary(), 0);
}

TEST_F(MockedMachine, AnAddressThatIsNoneCountsAsAbsent) {
  addPhysical("eth0", 1);
  setRoutes({{"eth0", 0}});
  for (const char* text :
       {"", "\n", "00:00:00:00:00:00\n", "2:0", "zz:00", "02:", ":", "02-00-00-00-00-01"}) {
    folder.write("sys/class/net/eth0/address", text);
    EXPECT_TRUE(machine->primaryInterfaceAddresses().empty()) << text;
  }
}

TEST(DefaultRoutes, LinesThatAreNoUsableDefaultRouteArePassedOver) {
  const std::string none(32, '0');
  const std::string ipv4 =
      "Iface\tDestination\tGateway\tFlags\tRefCnt\tUse\tMetric\tMask\tMTU\n"
      "net\t0000A8C0\t0\t0001\t0\t0\t0\t00FFFFFF\t0\n"
      "half\t00000000\t0\t0003\t0\t0\t0\t00000080\t0\n"  // 0.0.0.0/1
      "down\t00000000\t0\t0002\t0\t0\t0\t00000000\t0\n"
      "rejecting\t00000000\t0\t0201\t0\t0\t0\t00000000\t0\n"
      "odd\t00000000\t0\t0003\t0\t0\t12x\t00000000\t0\n"
      "negative\t00000000\t0\t0003\t0\t0\t-1\t00000000\t0\n"
      "short\t00000000\n\n\t\t\n"
      "good\t00000000\t0\t0003\t0\t0\t7\t00000000";
  const std::string ipv6 =
      none + " 00 " + none + " 00 " + none + " ffffffff 00000001 00000000 00200200 lo\n" + none +
      " 80 " + none + " 00 " + none + " 00000000 00000001 00000000 00000001 host\n" + none +
      " 00 " + none + " 00 " + none + " 00000006 00000001 00000000 00000003 better\n";
  EXPECT_THAT(interfacesOfDefaultRoutes(ipv4, ipv6), ElementsAre("better", "good"));
  EXPECT_THAT(interfacesOfDefaultRoutes("", ""), ElementsAre());
}

}  // namespace
}  // namespace Varnel::Platform::Linux
