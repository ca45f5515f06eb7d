// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <string_view>
#include <vector>

namespace Varnel::Platform::Linux {

/// The names of the interfaces that default routes lead through, best route first, from the
/// kernel's tables /proc/net/route and /proc/net/ipv6_route. Of equally good routes IPv4's come
/// first. Lines that cannot be read are passed over.
[[nodiscard]] std::vector<std::string> interfacesOfDefaultRoutes(std::string_view ipv4Table,
                                                                 std::string_view ipv6Table);

}  // namespace Varnel::Platform::Linux
