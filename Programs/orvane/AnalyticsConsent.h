// SPDX-License-Identifier: MIT
#pragma once

#include <string>

#include <Varnel/Tallyhouse/AnalyticsContext.h>

namespace Orvane {

class Console;

/// The user's answer, kept in the product's settings; not asked until then, and where the settings
/// cannot be read.
[[nodiscard]] Tallyhouse::Consent storedConsent();

/// Returns whether the answer is kept, and complains where it is not. It is granted or refused.
[[nodiscard]] bool storeConsent(Tallyhouse::Consent answer, Console& console);

/// "yes", "no" or "not asked".
[[nodiscard]] std::string textOf(Tallyhouse::Consent consent);

}  // namespace Orvane
