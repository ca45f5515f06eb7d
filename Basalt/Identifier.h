// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <string_view>

#include <Platform/Api.h>

namespace Basalt {

/// Joins a reverse-DNS base and a component into one identifier: "com.quennel.Orvane2" and
/// "SchedulerNotification" give "com.quennel.Orvane2.SchedulerNotification". Empty when either side
/// is empty. Any thread.
[[nodiscard]] VARNEL_API std::string identifier(std::string_view base, std::string_view component);

/// The suite-wide base of an application's bundle identifier, without the component that tells the
/// channel ("site" or "trial"): "com.quennel.site.Other" gives "com.quennel.Other". Any thread.
[[nodiscard]] VARNEL_API std::string baseBundleIdentifier(std::string_view bundleIdentifier);

}  // namespace Basalt
