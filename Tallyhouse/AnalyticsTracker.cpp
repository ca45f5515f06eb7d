// SPDX-License-Identifier: MIT
#include <Varnel/Tallyhouse/AnalyticsTracker.h>

#include <utility>

namespace Tallyhouse {

AnalyticsTracker::AnalyticsTracker(std::shared_ptr<AnalyticsTransport> transport, Consent consent)
    : context_(std::make_shared<AnalyticsContext>(std::move(transport), consent)) {}

AnalyticsTracker::AnalyticsTracker(AnalyticsContext::Ports ports,
                                   std::shared_ptr<AnalyticsTransport> transport, Consent consent)
    : context_(std::make_shared<AnalyticsContext>(ports, std::move(transport), consent)) {}

}  // namespace Tallyhouse
