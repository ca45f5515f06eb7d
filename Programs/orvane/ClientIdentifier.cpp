// SPDX-License-Identifier: MIT
#include <orvane/ClientIdentifier.h>

#include <Varnel/Context/ApplicationData.h>
#include <Varnel/Platform/Ports/UserDefaults.h>
#include <Varnel/Platform/Values/UUID.h>
#include <orvane/AnalyticsConsent.h>
#include <orvane/Console.h>

namespace Orvane {
namespace {

using Varnel::ApplicationData;

constexpr const char* identifierKey = "analyticsClientIdentifier";

}  // namespace

std::optional<std::string> storedClientIdentifier() {
  return ApplicationData::settings().text(identifierKey);
}

std::string keptClientIdentifier() {
  if (const auto stored = storedClientIdentifier()) return *stored;
  const std::string drawn = Varnel::Platform::randomUUIDString();
  if (ApplicationData::settings().set(identifierKey, drawn)) return drawn;
  // Another process may have taken the consent back, and the identifier with it, meanwhile.
  if (storedConsent() != Tallyhouse::Consent::granted) {
    static_cast<void>(ApplicationData::settings().remove(identifierKey));
    return drawn;
  }
  // Another process may have drawn one at the same time: the last one stays.
  return storedClientIdentifier().value_or(drawn);
}

bool forgetClientIdentifier(Console& console) {
  if (!storedClientIdentifier()) return true;
  const auto error = ApplicationData::settings().remove(identifierKey);
  if (error) console.complain("cannot forget the identifier: " + error->localizedDescription());
  return !error;
}

}  // namespace Orvane
