// SPDX-License-Identifier: MIT
#pragma once

#include <string>

namespace Varnel::Platform::Linux {

/// The name on the session bus under which a product's running application hears of its
/// notifications.
///
///     hostName("com.quennel.Orvane2");  // "com.quennel.Varnel.Host.com.quennel.Orvane2.Client"
///
/// It is not the application's own name, which stays free for the host. Any base identifier gives a
/// valid name, and no two the same: what names of the bus lack stands in hexadecimal behind an
/// underscore, and of an identifier that is too long the end stands as a digest.
[[nodiscard]] std::string hostName(const std::string& baseIdentifier);

/// The name that a process of the product has, or waits for, while it is in front.
[[nodiscard]] std::string frontName(const std::string& baseIdentifier);

}  // namespace Varnel::Platform::Linux
