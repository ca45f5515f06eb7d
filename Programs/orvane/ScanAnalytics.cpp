// SPDX-License-Identifier: MIT
#include <orvane/ScanAnalytics.h>

#include <chrono>
#include <thread>

#include <Varnel/Context/ApplicationData.h>
#include <Varnel/Identification/Analytics/CustomDimensionsHolder.h>
#include <Varnel/Platform/Values/UUID.h>
#include <orvane/AnalyticsConsent.h>
#include <orvane/ClientIdentifier.h>
#include <orvane/Console.h>

namespace Orvane {
namespace {

using Tallyhouse::Consent;
using Tallyhouse::SpoolingTransport;
using Varnel::Platform::URL;

constexpr auto maxGoodbye = std::chrono::seconds(2);
constexpr auto pause = std::chrono::milliseconds(50);

class ScanSender final : public Varnel::CommonAnalyticsSender {
 public:
  using CommonAnalyticsSender::CommonAnalyticsSender;
  [[nodiscard]] std::string contextName() const override { return "Scan"; }
};

bool isOnThisMachine(const URL& url) {
  return url.hasHost("127.0.0.1") || url.hasHost("localhost") || url.hasHost("[::1]");
}

// Without consent there is no identifier to tell runs by: what is printed then shows one of its
// kind, which nobody keeps.
void identifyClient(Consent consent) {
  Varnel::CustomDimensionsHolder::setClientIdentifier(
      consent == Consent::granted ? keptClientIdentifier() : Varnel::Platform::randomUUIDString());
}

std::shared_ptr<SpoolingTransport> transportTo(const URL& endpoint) {
  return SpoolingTransport::make({.endpoint = endpoint,
                                  .trackingID = "orvane",
                                  .clientID = Varnel::CustomDimensionsHolder::clientIdentifier(),
                                  .spoolPath = Varnel::ApplicationData::analyticsSpoolPath(),
                                  .plainHTTP = isOnThisMachine(endpoint)
                                                   ? SpoolingTransport::PlainHTTP::allowed
                                                   : SpoolingTransport::PlainHTTP::refused});
}

// It is never started, and so sends nothing, wherever that would go.
std::unique_ptr<SpoolingTransport> idleTransport() {
  return SpoolingTransport::make({.endpoint = *URL::parse("https://nowhere.invalid/"),
                                  .trackingID = {},
                                  .clientID = {},
                                  .spoolPath = Varnel::ApplicationData::analyticsSpoolPath()});
}

}  // namespace

std::int64_t ScanAnalytics::waitingEvents() {
  return idleTransport()->counts().waiting;
}

bool ScanAnalytics::isEndpoint(const std::string& text) {
  const auto url = URL::parse(text);
  if (!url || url->components().host.value_or("").empty()) return false;
  return url->hasScheme("https") || (url->hasScheme("http") && isOnThisMachine(*url));
}

bool ScanAnalytics::discardEvents(std::chrono::milliseconds patience) {
  const auto transport = idleTransport();
  for (const auto end = std::chrono::steady_clock::now() + patience;;) {
    transport->discardAll();
    if (transport->hasDiscardedAll()) return true;
    if (std::chrono::steady_clock::now() > end) return false;
    std::this_thread::sleep_for(pause);
  }
}

ScanAnalytics::ScanAnalytics(const std::optional<std::string>& endpoint, bool printsEvents,
                             Console& console) {
  const Consent consent = storedConsent();
  const bool sends = endpoint && consent == Consent::granted;
  if (endpoint && !sends)
    console.complain("no events are sent: " +
                     std::string(consent == Consent::refused ? "the user has refused"
                                                             : "the user has not been asked") +
                     " (orvane analytics consent yes)");
  // The command that kept the refusal may have been killed before it came to that.
  if (endpoint && consent == Consent::refused) {
    discardEvents(std::chrono::milliseconds(0));
    static_cast<void>(forgetClientIdentifier(console));
  }
  if (!sends && !printsEvents) return;
  identifyClient(consent);
  if (sends) transport_ = transportTo(*URL::parse(*endpoint));
  auto tracker = std::make_shared<Tallyhouse::AnalyticsTracker>(transport_, consent);
  tracker->setShouldPrintEvents(printsEvents);
  sender_ = std::make_unique<ScanSender>(std::move(tracker));
}

ScanAnalytics::~ScanAnalytics() {
  if (transport_ && !transport_->drain(maxGoodbye)) sender_->log("Events wait for the next run");
}

void ScanAnalytics::scanStarted(std::size_t folders) {
  if (sender_)
    sender_->trackEvent("Started", std::nullopt, static_cast<std::int64_t>(folders), {}, {});
}

void ScanAnalytics::scanCancelled() {
  if (sender_) sender_->trackEvent("Cancelled", std::nullopt, std::nullopt, {}, {});
}

void ScanAnalytics::scanFinished(std::size_t groups) {
  if (sender_)
    sender_->trackEvent("Finished", groups > 0 ? "Duplicates" : "No Duplicates",
                        static_cast<std::int64_t>(groups), {}, {});
}

}  // namespace Orvane
