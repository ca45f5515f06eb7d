// SPDX-License-Identifier: MIT
#include <orvane/AnalyticsCommand.h>

#include <orvane/AnalyticsConsent.h>
#include <orvane/Console.h>
#include <orvane/ScanAnalytics.h>

namespace Orvane {

int AnalyticsCommand::run(Console& console) const {
  // The answer first: it holds whatever becomes of the spool.
  if (answer && !storeConsent(*answer, console)) return 1;
  if (answer == Tallyhouse::Consent::refused) ScanAnalytics::discardEvents();
  return console.writeResult("consent: " + textOf(storedConsent()) + "\n") ? 0 : 1;
}

}  // namespace Orvane
