// SPDX-License-Identifier: MIT
#include <orvane/AnalyticsCommand.h>

#include <orvane/AnalyticsConsent.h>
#include <orvane/Console.h>
#include <orvane/ScanAnalytics.h>

namespace Orvane {

int AnalyticsCommand::run(Console& console) const {
  const bool isKept = !answer || storeConsent(*answer, console);
  // Whether it is kept or not: the user wants these events gone.
  const bool isDone = answer != Tallyhouse::Consent::refused || ScanAnalytics::discardEvents();
  if (!isDone) console.complain("the events that wait cannot be thrown away now; try again");
  if (!isKept || !isDone) return 1;
  return console.writeResult("consent: " + textOf(storedConsent()) + "\n") ? 0 : 1;
}

}  // namespace Orvane
