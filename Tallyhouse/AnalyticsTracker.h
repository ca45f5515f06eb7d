// SPDX-License-Identifier: MIT
#pragma once

#include <atomic>
#include <memory>

#include <Varnel/Platform/Api.h>
#include <Varnel/Tallyhouse/AnalyticsContext.h>

namespace Tallyhouse {

/// Made once by a host, and given to every sender of events.
///
///     auto tracker = std::make_shared<AnalyticsTracker>(transport);
///     if (userAgreed) tracker->context()->setConsent(Consent::granted);
///     BaseAnalyticsSender(tracker).trackEvent("Opened", "window", std::nullopt, {}, {});
///
/// Without a transport, and without the user's consent, nothing is collected. Any thread.
class VARNEL_API AnalyticsTracker final {
 public:
  explicit AnalyticsTracker(std::shared_ptr<AnalyticsTransport> transport = nullptr,
                            Consent consent = Consent::notAsked);
  AnalyticsTracker(AnalyticsContext::Ports ports, std::shared_ptr<AnalyticsTransport> transport,
                   Consent consent = Consent::notAsked);
  AnalyticsTracker(const AnalyticsTracker&) = delete;
  AnalyticsTracker& operator=(const AnalyticsTracker&) = delete;

  [[nodiscard]] const std::shared_ptr<AnalyticsContext>& context() const { return context_; }

  /// Whether senders echo each event into the log. False at first.
  [[nodiscard]] bool shouldPrintEvents() const { return shouldPrintEvents_; }
  void setShouldPrintEvents(bool shouldPrint) { shouldPrintEvents_ = shouldPrint; }

 private:
  std::shared_ptr<AnalyticsContext> context_;
  std::atomic<bool> shouldPrintEvents_ = false;
};

}  // namespace Tallyhouse
