// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <string_view>

#include <Varnel/Platform/Api.h>

namespace Basalt {

/// Joins a reverse-DNS base and a component into one identifier: "com.quennel.Orvane2" and
/// "SchedulerNotification" give "com.quennel.Orvane2.SchedulerNotification". Empty when either side
/// is empty. Any thread.
[[nodiscard]] VARNEL_API std::string identifier(std::string_view base, std::string_view component);

/// A bundle identifier without the component that tells the distribution channel: the first "site"
/// or "trial" that something follows. "com.quennel.site.Other" gives "com.quennel.Other". Any
/// thread.
[[nodiscard]] VARNEL_API std::string withoutChannelComponent(std::string_view bundleIdentifier);

}  // namespace Basalt
