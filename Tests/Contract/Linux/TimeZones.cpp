// SPDX-License-Identifier: MIT
#include <Tests/Contract/TimeZonesContract.h>

#include <optional>

#include <Tests/Support/LocalZone.h>
#include <Varnel/Platform/Linux/Adapters.h>

namespace Varnel::Platform::Contract {
namespace {

class LinuxWorld final : public TimeZonesWorld {
 public:
  [[nodiscard]] std::string obstacle() const override {
    const Tests::LocalZone berlin("Europe/Berlin");
    return zones_->localIdentifier() == "UTC" ? "The system has no table of time zones." : "";
  }
  TimeZones& zones() override { return *zones_; }
  void moveUser(const std::string& zone) override { local_.emplace(zone.c_str()); }

 private:
  const std::unique_ptr<TimeZones> zones_ = Linux::makeTimeZones();
  std::optional<Tests::LocalZone> local_;
};

INSTANTIATE_TEST_SUITE_P(Linux, TimeZonesContract, TimeZonesContract::on<LinuxWorld>());

}  // namespace
}  // namespace Varnel::Platform::Contract
