// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <string_view>
#include <vector>

namespace Varnel::Platform::Linux {

/// The names of the interfaces that default routes lead through, best route first, from the
/// kernel's tables /proc/net/route and /proc/net/ipv6_route. Among equally good routes, those of
/// IPv4 come first. Lines that cannot be parsed are skipped.
[[nodiscard]] std::vector<std::string> interfacesOfDefaultRoutes(std::string_view ipv4Table,
                                                                 std::string_view ipv6Table);

}  // namespace Varnel::Platform::Linux
