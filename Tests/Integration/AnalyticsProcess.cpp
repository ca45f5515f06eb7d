// SPDX-License-Identifier: MIT
// AnalyticsProcess ENDPOINT SPOOL COUNT [drain|end]: tracks that many events, whose names it prints
// as soon as they are kept, and says "tracked". An event that is only held in memory at first is
// "~NAME" until then. Then it waits to be killed, or ends; with "drain" it drains the spool
// before that and says whether its events were "delivered" or "left".
#include <unistd.h>

#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <string>
#include <string_view>
#include <thread>
#include <vector>

#include <Varnel/Tallyhouse/AnalyticsTracker.h>
#include <Varnel/Tallyhouse/SpoolingTransport.h>

int main(int count, char** arguments) {
  using namespace Tallyhouse;
  if (count < 4) return EXIT_FAILURE;
  const auto say = [](const std::string& line) {
    std::puts(line.c_str());
    std::fflush(stdout);
  };
  const std::shared_ptr<SpoolingTransport> transport =
      SpoolingTransport::make({.endpoint = *Varnel::Platform::URL::parse(arguments[1]),
                               .trackingID = "QN-1",
                               .clientID = "12.34",
                               .spoolPath = arguments[2],
                               .plainHTTP = SpoolingTransport::PlainHTTP::allowed});
  AnalyticsTracker tracker(transport, Consent::granted);
  std::vector<std::string> held;
  const auto sayKept = [&] {
    if (transport->counts().held > 0) return;
    for (const std::string& name : held) say(name);
    held.clear();
  };
  for (int i = 0; i < std::atoi(arguments[3]); ++i) {
    held.push_back(std::to_string(::getpid()) + "." + std::to_string(i));
    tracker.context()->trackEvent("Process", held.back(), std::nullopt, i, {}, {});
    sayKept();
    if (!held.empty()) say("~" + held.back());
  }
  while (!held.empty()) {
    std::this_thread::sleep_for(std::chrono::milliseconds(1));
    sayKept();
  }
  say("tracked");
  while (count == 4) ::pause();
  if (arguments[4] == std::string_view("drain"))
    say(transport->drain(std::chrono::minutes(1)) ? "delivered" : "left");
}
