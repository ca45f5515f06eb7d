// SPDX-License-Identifier: MIT
#include <Removal/DiskPlace.h>

#include <climits>
#include <memory>

#include <Varnel/DiskAccess/DiskAccessManager.h>
#include <Varnel/Platform/Values/URL.h>

namespace Orvane {

Varnel::DiskAccessGuard placeOnDiskOf(const std::string& path, Varnel::DiskAccessManager& disks) {
  using Varnel::Platform::QualityOfService;
  std::unique_ptr<Varnel::DiskAccessingSession> session;
  // The system looks up no path that is too long, nor one that is not there.
  for (std::string known = path; !session && !known.empty();) {
    if (known.size() < PATH_MAX)
      session = disks.beginAccessingURL(Varnel::Platform::URL::fileURLWithPath(known),
                                        "Removal of duplicates", QualityOfService::utility, false);
    if (known == "/") break;
    known.resize(known.rfind('/'));
    if (known.empty()) known = "/";
  }
  return Varnel::DiskAccessGuard(std::move(session));
}

}  // namespace Orvane
