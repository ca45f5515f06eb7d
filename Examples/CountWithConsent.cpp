// SPDX-License-Identifier: MIT
// An event, with the user's consent and without: what is kept until the server can be reached.
//   CountWithConsent ENDPOINT
#include <iostream>
#include <memory>

#include <Varnel/Context/ApplicationData.h>
#include <Varnel/Identification/Analytics/CommonAnalyticsSender.h>
#include <Varnel/Identification/Analytics/CustomDimensionsHolder.h>
#include <Varnel/Tallyhouse/AnalyticsTracker.h>
#include <Varnel/Tallyhouse/SpoolingTransport.h>

using Tallyhouse::AnalyticsTracker, Tallyhouse::Consent, Tallyhouse::SpoolingTransport;
using namespace Varnel;

int main(int count, char** arguments) {
  const auto endpoint = count > 1 ? Platform::URL::parse(arguments[1]) : std::nullopt;
  if (!endpoint) {
    std::cerr << "usage: CountWithConsent ENDPOINT\n";
    return 2;
  }
  const std::shared_ptr<SpoolingTransport> transport =
      SpoolingTransport::make({.endpoint = *endpoint,
                               .trackingID = "EX-1",
                               .clientID = CustomDimensionsHolder::clientIdentifier(),
                               .spoolPath = ApplicationData::analyticsSpoolPath()});
  if (!transport) {
    std::cerr << "events go to https endpoints alone\n";
    return 2;
  }
  const auto tracker = std::make_shared<AnalyticsTracker>(transport);
  CommonAnalyticsSender sender(tracker);
  const auto tell = [&](const char* when) {
    sender.trackCustomEvent("Window", "Opened", "Preferences", 1);
    std::cout << when << ": " << transport->counts().waiting << " waiting\n";
  };

  tell("nobody was asked");
  tracker->context()->setConsent(Consent::granted);
  tell("the user agreed");
  tracker->context()->setConsent(Consent::refused);
  tell("the user withdrew");
}
