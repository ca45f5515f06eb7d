// SPDX-License-Identifier: MIT
#include <optional>

#include <Tests/Contract/MainLoopWorlds.h>
#include <Tests/Contract/UserWorlds.h>
#include <Tests/Support/Zones.h>
#include <Varnel/Platform/Generic/HostedApplication.h>
#include <Varnel/Platform/Ports/Ports.h>

// What each system has of its own and every test can arrange.
namespace Varnel::Platform::Contract {
namespace {

INSTANTIATE_TEST_SUITE_P(Hosted, ApplicationContract, on<HostedApplication>());

class SystemQueue final : public WorldOf<MainQueue> {
 public:
  MainQueue& port() override { return systemPorts().mainQueue; }
};
INSTANTIATE_TEST_SUITE_P(System, MainQueueContract, on<SystemQueue>());

class SystemZones final : public TimeZonesWorld {
 public:
  [[nodiscard]] std::string obstacle() const override {
    const Tests::LocalZone berlin("Europe/Berlin");
    return zones_.localIdentifier() == "UTC" ? "The system has no table of time zones." : "";
  }
  TimeZones& port() override { return zones_; }
  void moveUser(const std::string& zone) override { local_.emplace(zone.c_str()); }

 private:
  TimeZones& zones_ = systemPorts().timeZones;
  std::optional<Tests::LocalZone> local_;
};
INSTANTIATE_TEST_SUITE_P(System, TimeZonesContract, on<SystemZones>());

}  // namespace
}  // namespace Varnel::Platform::Contract
