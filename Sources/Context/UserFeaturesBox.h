// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>
#include <memory>
#include <string>

#include <Varnel/Basalt/JSON.h>
#include <Varnel/Context/UserFeatures.h>
#include <Varnel/Platform/Api.h>

namespace Varnel {

/// `UserFeatures` as an object with plain truth values, for interface code.
///
///     auto box = UserFeaturesBox::make({UserFeatures::irate});
///     box->isSharingHidden();  // true
///
/// Four of its properties ask what is hidden and one asks what is enabled: published names.
/// Immutable and shared; any thread.
class VARNEL_API UserFeaturesBox final : public std::enable_shared_from_this<UserFeaturesBox> {
 public:
  using Pointer = std::shared_ptr<const UserFeaturesBox>;

  static constexpr bool canImportJSON = true;
  static constexpr bool canExportJSON = true;
  static constexpr bool canConvertJSON = true;

  [[nodiscard]] static Pointer make(UserFeatures boxed);

  /// Reads JSON as `UserFeatures` does, and throws as it does.
  explicit UserFeaturesBox(const Basalt::JSON& json) : boxed_(json) {}
  explicit UserFeaturesBox(UserFeatures boxed) : boxed_(boxed) {}
  UserFeaturesBox(const UserFeaturesBox&) = delete;
  UserFeaturesBox& operator=(const UserFeaturesBox&) = delete;

  [[nodiscard]] Basalt::JSON exportJSON() const;

  [[nodiscard]] UserFeatures boxed() const { return boxed_; }
  [[nodiscard]] UserFeatures value() const { return boxed_; }

  [[nodiscard]] bool isSharingHidden() const { return !boxed_.contains(UserFeatures::sharing); }
  [[nodiscard]] bool isLearnMoreHidden() const {
    return !boxed_.contains(UserFeatures::crossPromo);
  }
  [[nodiscard]] bool isAchievementsHidden() const {
    return !boxed_.contains(UserFeatures::achievements);
  }
  [[nodiscard]] bool isIRateEnabled() const { return boxed_.contains(UserFeatures::irate); }
  [[nodiscard]] bool isCleanResultsPromoHidden() const {
    return !boxed_.contains(UserFeatures::cleanResultsPromo);
  }

  /// The box itself: it never changes. Only for boxes held by a shared pointer.
  [[nodiscard]] Pointer copy() const { return shared_from_this(); }

  [[nodiscard]] std::size_t hash() const { return std::hash<UserFeatures>{}(boxed_); }
  [[nodiscard]] std::string description() const;

  bool operator==(const UserFeaturesBox& other) const { return boxed_ == other.boxed_; }

 private:
  const UserFeatures boxed_;
};

}  // namespace Varnel
