// SPDX-License-Identifier: MIT
// Links that tell the vendor which product, version and client they were clicked in.
#include <iostream>
#include <memory>

#include <Varnel/Identification/Links/TDSService.h>
#include <Varnel/Identification/User/UserIdentificationInfo.h>
#include <Varnel/Identification/User/UserIdentificator.h>

using namespace Varnel;

int main() {
  const TDSService links(
      std::make_shared<TDSConfiguration>("http", "links.example", "/index.php", "Shop", "shop"),
      std::make_shared<UserIdentificationInfo>(std::make_shared<UserIdentificator>()));

  // To an action of the redirect service, and to a page that keeps its own parameters.
  if (const auto buy = links.buildURL("buy", {{"coupon", "spring"}}))
    std::cout << buy->absoluteString() << '\n';
  if (const auto page =
          links.prepareUrl(*Platform::URL::parse("https://shop.example/prices?in=eur")))
    std::cout << page->absoluteString() << '\n';
}
