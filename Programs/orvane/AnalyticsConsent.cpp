// SPDX-License-Identifier: MIT
#include <orvane/AnalyticsConsent.h>

#include <Varnel/Context/ApplicationData.h>
#include <Varnel/Platform/Ports/UserDefaults.h>
#include <orvane/Console.h>

namespace Orvane {
namespace {

using Tallyhouse::Consent;

constexpr const char* consentKey = "analyticsConsent";

}  // namespace

Consent storedConsent() {
  const auto isGranted = Varnel::ApplicationData::settings().truthValue(consentKey);
  if (!isGranted) return Consent::notAsked;
  return *isGranted ? Consent::granted : Consent::refused;
}

bool storeConsent(Consent answer, Console& console) {
  const auto error =
      Varnel::ApplicationData::settings().set(consentKey, answer == Consent::granted);
  if (error) console.complain("cannot keep the answer: " + error->localizedDescription());
  return !error;
}

std::string textOf(Consent consent) {
  switch (consent) {
    case Consent::granted:
      return "yes";
    case Consent::refused:
      return "no";
    case Consent::notAsked:
      break;
  }
  return "not asked";
}

}  // namespace Orvane
