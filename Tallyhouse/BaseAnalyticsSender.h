// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <string_view>

#include <Varnel/Basalt/RouterActionSenderKind.h>
#include <Varnel/Platform/Api.h>
#include <Varnel/Tallyhouse/AnalyticsContext.h>
#include <Varnel/Tallyhouse/AnalyticsTracker.h>

namespace Tallyhouse {

/// Sends the events of one part of an application, in that part's category.
///
///     class WindowSender : public BaseAnalyticsSender {
///       using BaseAnalyticsSender::BaseAnalyticsSender;
///       std::string contextName() const override { return "Window"; }
///     };
///     WindowSender(tracker).trackEvent("Close", RouterActionSenderKind::menuItem);
///
/// Any thread, if the overrides of a subclass allow it. Nothing waits for the network. The tracker
/// is not null.
class VARNEL_API BaseAnalyticsSender {
 public:
  explicit BaseAnalyticsSender(std::shared_ptr<AnalyticsTracker> tracker);
  virtual ~BaseAnalyticsSender() = default;

  [[nodiscard]] const std::shared_ptr<AnalyticsTracker>& tracker() const { return tracker_; }
  [[nodiscard]] AnalyticsContext& context() const { return *tracker_->context(); }

  /// The part of the application; empty unless a class names its own.
  [[nodiscard]] virtual std::string contextName() const;
  /// The category of `trackEvent`'s events: the context's name unless a class has another.
  [[nodiscard]] virtual std::string categoryName() const;

  /// Sends an event in the sender's own category.
  virtual void trackEvent(std::string_view action, const std::optional<std::string>& label,
                          std::optional<std::int64_t> value,
                          const CustomDimensions& customDimensions,
                          const CustomMetrics& customMetrics);

  /// The same, with the name of what triggered the action as its label.
  void trackEvent(std::string_view action, Basalt::RouterActionSenderKind sender,
                  std::optional<std::int64_t> value = std::nullopt,
                  const CustomDimensions& customDimensions = {},
                  const CustomMetrics& customMetrics = {});

  /// "Touchbar", "Shortcut", "Menu Item", "Button" or "Automatic".
  [[nodiscard]] static std::string sourceFromSender(Basalt::RouterActionSenderKind sender);

 private:
  std::shared_ptr<AnalyticsTracker> tracker_;
};

}  // namespace Tallyhouse
