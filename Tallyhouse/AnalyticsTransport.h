// SPDX-License-Identifier: MIT
#pragma once

#include <Varnel/Platform/Api.h>
#include <Varnel/Tallyhouse/AnalyticsEvent.h>

namespace Tallyhouse {

/// The way that events take from the application to the place where they are counted.
/// `SpoolingTransport` posts them to a server, `Testing::MemoryTransport` keeps them for a test.
///
/// Called by one thread at a time. No operation waits for the network, and none throws.
class VARNEL_API AnalyticsTransport {
 public:
  virtual ~AnalyticsTransport() = default;

  /// Called when the user has consented, perhaps more than once. Events of earlier runs may be
  /// sent from now on.
  virtual void start() noexcept = 0;

  /// Takes over one event.
  virtual void accept(const AnalyticsEvent& event) noexcept = 0;

  /// Forgets every event that has not arrived yet, those of earlier runs included, and sends none
  /// until `start`.
  virtual void discardAll() noexcept = 0;
};

}  // namespace Tallyhouse
