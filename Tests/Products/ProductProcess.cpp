// SPDX-License-Identifier: MIT
// Prints what the framework says of the product that this program is, a fact a line.
#include <iostream>
#include <memory>

#include <Varnel/Context/Globals.h>
#include <Varnel/Context/TargetKind.h>
#include <Varnel/Identification/Links/TDSService.h>
#include <Varnel/Identification/User/Identificator.h>
#include <Varnel/Logging/Logger.h>
#include <Varnel/Reminders/SchedulePeriodOption.h>

using namespace Varnel;

namespace {

struct Nobody final : Identificator {
  std::string uniqueClientIdentifier() const override { return "7"; }
};

std::string linkOfProduct() {
  const TDSService links(std::make_shared<TDSConfiguration>("Product", "p"),
                         std::make_shared<Nobody>());
  const auto link = links.buildURL("buy", {});
  return link ? link->absoluteString().substr(0, link->absoluteString().find('?')) : "no link";
}

}  // namespace

int main() {
  std::cout << std::unitbuf << Globals::substitutingApplicationName("Welcome to Orvane 2") << '\n'
            << Globals::applicationVersionString() << '\n'
            << Globals::baseIdentifier() << '\n'
            << linkOfProduct() << '\n'
            << (Globals::isPrivateBetaMode() ? "beta" : "released") << '\n'
            << TargetKind::current().bundleID() << '\n'
            << SchedulePeriodOption::default_().accessibilityIdentifier() << '\n';
}
