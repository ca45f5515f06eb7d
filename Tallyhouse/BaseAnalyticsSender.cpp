// SPDX-License-Identifier: MIT
#include <Varnel/Tallyhouse/BaseAnalyticsSender.h>

#include <utility>

namespace Tallyhouse {

BaseAnalyticsSender::BaseAnalyticsSender(std::shared_ptr<AnalyticsTracker> tracker)
    : tracker_(std::move(tracker)) {}

std::string BaseAnalyticsSender::contextName() const {
  return {};
}

std::string BaseAnalyticsSender::categoryName() const {
  return contextName();
}

void BaseAnalyticsSender::trackEvent(std::string_view action,
                                     const std::optional<std::string>& label,
                                     std::optional<std::int64_t> value,
                                     const CustomDimensions& customDimensions,
                                     const CustomMetrics& customMetrics) {
  context().trackEvent(categoryName(), action, label, value, customDimensions, customMetrics);
}

void BaseAnalyticsSender::trackEvent(std::string_view action, Basalt::RouterActionSenderKind sender,
                                     std::optional<std::int64_t> value,
                                     const CustomDimensions& customDimensions,
                                     const CustomMetrics& customMetrics) {
  trackEvent(action, sourceFromSender(sender), value, customDimensions, customMetrics);
}

std::string BaseAnalyticsSender::sourceFromSender(Basalt::RouterActionSenderKind sender) {
  switch (sender) {
    case Basalt::RouterActionSenderKind::touchBar:
      return "Touchbar";
    case Basalt::RouterActionSenderKind::keyboardShortcut:
      return "Shortcut";
    case Basalt::RouterActionSenderKind::menuItem:
      return "Menu Item";
    case Basalt::RouterActionSenderKind::button:
      return "Button";
    case Basalt::RouterActionSenderKind::automatic:
      break;
  }
  return "Automatic";
}

}  // namespace Tallyhouse
