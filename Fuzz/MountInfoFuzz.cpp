// SPDX-License-Identifier: MIT
// The kernel's tables of mounts and of routes, and udev's names.
#include <algorithm>

#include <Fuzz/Fuzz.h>
#include <Varnel/Platform/Linux/Disks/MountInfo.h>
#include <Varnel/Platform/Linux/Disks/UdevDatabase.h>
#include <Varnel/Platform/Linux/Identity/DefaultRoutes.h>

using namespace Varnel::Platform::Linux;

static void fuzz(std::string_view input) {
  const auto mounts = parseMountInfo(input);
  require(mounts.size() <=
          static_cast<std::size_t>(std::count(input.begin(), input.end(), '\n')) + 1);
  for (const Mount& mount : mounts) require(mount.target.starts_with('/'));
  for (const Mount& mount : reachableMounts(mounts))
    require(std::find(mounts.begin(), mounts.end(), mount) != mounts.end());

  require(udevDecoded(input).size() <= input.size());
  const auto [ipv4, ipv6] = cutAt('\f', input);
  for (const std::string& name : interfacesOfDefaultRoutes(ipv4, ipv6))
    require(input.find(name) != input.npos);
}
