// SPDX-License-Identifier: MIT
#include <Varnel/Context/UserFeaturesBox.h>

#include <fmt/format.h>
namespace Varnel {

UserFeaturesBox::Pointer UserFeaturesBox::make(UserFeatures boxed) {
  return std::make_shared<const UserFeaturesBox>(boxed);
}

Basalt::JSON UserFeaturesBox::exportJSON() const {
  return boxed_.exportJSON();
}

std::string UserFeaturesBox::description() const {
  return fmt::format("UserFeatures(rawValue: {})", boxed_.rawValue());
}

}  // namespace Varnel
