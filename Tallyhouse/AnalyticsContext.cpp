// SPDX-License-Identifier: MIT
#include <Varnel/Tallyhouse/AnalyticsContext.h>

#include <exception>
#include <utility>

#include <Varnel/Platform/Ports/Clock.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Tallyhouse/AnalyticsTransport.h>

namespace Tallyhouse {

AnalyticsContext::AnalyticsContext(Ports ports, std::shared_ptr<AnalyticsTransport> transport,
                                   Consent consent)
    : ports_(ports), transport_(std::move(transport)), consent_(consent) {
  if (consent_ != Consent::notAsked) tellTransport();
}

AnalyticsContext::AnalyticsContext(std::shared_ptr<AnalyticsTransport> transport, Consent consent)
    : AnalyticsContext(Varnel::Platform::processPorts(), std::move(transport), consent) {}

AnalyticsContext::AnalyticsContext(const Varnel::Platform::Ports& ports,
                                   std::shared_ptr<AnalyticsTransport> transport, Consent consent)
    : AnalyticsContext({.clock = ports.clock}, std::move(transport), consent) {}

void AnalyticsContext::trackEvent(std::string_view category, std::string_view action,
                                  const std::optional<std::string>& label,
                                  std::optional<std::int64_t> value,
                                  const CustomDimensions& customDimensions,
                                  const CustomMetrics& customMetrics, bool isTest) noexcept try {
  if (!transport_) return;
  AnalyticsEvent event{.uuid = {},
                       .date = ports_.clock.now(),
                       .category = std::string(category),
                       .action = std::string(action),
                       .label = label,
                       .value = value,
                       .customDimensions = customDimensions,
                       .customMetrics = customMetrics,
                       .isTest = isTest};
  const std::lock_guard lock(mutex_);
  if (consent_ != Consent::granted) return;
  event.uuid = uuids_.next();
  transport_->accept(event);
} catch (const std::exception&) {
  // Out of memory. The event is lost and the application goes on.
}

Consent AnalyticsContext::consent() const noexcept {
  const std::lock_guard lock(mutex_);
  return consent_;
}

void AnalyticsContext::setConsent(Consent consent) noexcept {
  const std::lock_guard lock(mutex_);
  consent_ = consent;
  tellTransport();
}

void AnalyticsContext::tellTransport() noexcept {
  if (!transport_) return;
  if (consent_ == Consent::granted)
    transport_->start();
  else
    transport_->discardAll();
}

}  // namespace Tallyhouse
