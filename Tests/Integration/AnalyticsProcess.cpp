// SPDX-License-Identifier: MIT
// AnalyticsProcess ENDPOINT SPOOL COUNT: tracks that many events, says so, and waits to be killed.
#include <unistd.h>

#include <cstdio>
#include <cstdlib>
#include <string>

#include <Varnel/Tallyhouse/AnalyticsTracker.h>
#include <Varnel/Tallyhouse/SpoolingTransport.h>

int main(int count, char** arguments) {
  using namespace Tallyhouse;
  if (count != 4) return EXIT_FAILURE;
  AnalyticsTracker tracker(
      SpoolingTransport::make({.endpoint = *Varnel::Platform::URL::parse(arguments[1]),
                               .trackingID = "QN-1",
                               .clientID = "12.34",
                               .spoolPath = arguments[2],
                               .plainHTTP = SpoolingTransport::PlainHTTP::allowed}),
      Consent::granted);
  for (int i = 0; i < std::atoi(arguments[3]); ++i)
    tracker.context()->trackEvent("Process", std::to_string(i), std::nullopt, i, {}, {});
  std::puts("tracked");
  std::fflush(stdout);
  for (;;) ::pause();
}
