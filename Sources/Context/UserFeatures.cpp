// SPDX-License-Identifier: MIT
#include <Varnel/Context/UserFeatures.h>

#include <array>
#include <string_view>
#include <utility>

#include <Varnel/Basalt/JSON.h>

namespace Varnel {
namespace {

constexpr std::array<std::pair<std::string_view, UserFeatures>, 5> namesOfMembers{{
    {"sharing", UserFeatures::sharing},
    {"cross-promo", UserFeatures::crossPromo},
    {"achievements", UserFeatures::achievements},
    {"irate", UserFeatures::irate},
    {"clean-results-promo", UserFeatures::cleanResultsPromo},
}};

}  // namespace

UserFeatures::UserFeatures(const Basalt::JSON& json) {
  for (const std::string& name : Basalt::importStrings(json, "UserFeatures"))
    for (const auto& [knownName, member] : namesOfMembers)
      if (name == knownName) insert(member);
}

Basalt::JSON UserFeatures::exportJSON() const {
  Platform::PropertyList names;
  for (const auto& [name, member] : namesOfMembers)
    if (contains(member)) names.emplace_back(name);
  return names;
}

}  // namespace Varnel
