// SPDX-License-Identifier: MIT
#include <orvane/AnalyticsCommand.h>

#include <string>

#include <orvane/AnalyticsConsent.h>
#include <orvane/ClientIdentifier.h>
#include <orvane/Console.h>
#include <orvane/ScanAnalytics.h>

namespace Orvane {

int AnalyticsCommand::run(Console& console) const {
  using enum Tallyhouse::Consent;
  bool isKept = answer != refused || storeConsent(refused, console);
  // Whether it is kept or not: the user wants these events gone. What an earlier refusal could not
  // throw away must not be sent by a later consent, and events that name the old identifier would
  // tell the server whose the new one is.
  const bool mustDiscard = resets || answer == refused || (answer && storedConsent() == refused);
  const bool isDone = !mustDiscard || ScanAnalytics::discardEvents();
  if (!isDone) console.complain("the events that wait cannot be thrown away now; try again");
  if (answer == refused || (isDone && mustDiscard))
    isKept = forgetClientIdentifier(console) && isKept;
  if (isDone && isKept && answer == granted) isKept = storeConsent(granted, console);
  if (!isKept || !isDone) return 1;
  std::string result = "consent: " + textOf(storedConsent()) + "\n";
  const auto waiting = ScanAnalytics::waitingEvents();
  if (waiting > 0) result += "waiting: " + std::to_string(waiting) + "\n";
  return console.writeResult(result) ? 0 : 1;
}

}  // namespace Orvane
