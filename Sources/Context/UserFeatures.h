// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <functional>
#include <initializer_list>
#include <optional>
#include <string>

#include <Varnel/Basalt/JSON.h>
#include <Varnel/Platform/Api.h>

namespace Varnel {

/// The set of optional features that a build shows its user. A member that is present is shown (or,
/// for the rate prompt, enabled).
///
///     const UserFeatures suggested(Basalt::parseJSON(R"(["sharing", "irate"])"));
///     suggested.contains(UserFeatures::irate);  // true
///
/// A value of one word with the algebra of sets; bits that name no member are kept as they are. As
/// JSON it is a list of names.
class VARNEL_API UserFeatures final {
 public:
  static constexpr bool canImportJSON = true;
  static constexpr bool canExportJSON = true;
  static constexpr bool canConvertJSON = true;

  static const UserFeatures sharing;
  static const UserFeatures crossPromo;
  static const UserFeatures achievements;
  static const UserFeatures irate;
  static const UserFeatures cleanResultsPromo;

  constexpr UserFeatures() = default;
  constexpr explicit UserFeatures(std::int64_t rawValue) : rawValue_(rawValue) {}
  constexpr UserFeatures(std::initializer_list<UserFeatures> members) {
    for (const UserFeatures member : members) rawValue_ |= member.rawValue_;
  }

  /// Names that no member bears are skipped. Throws `Basalt::JSONError` (type mismatch,
  /// "UserFeatures" at "root") for anything but a list of strings.
  explicit UserFeatures(const Basalt::JSON& json);

  /// The names of the members present, in no promised order.
  [[nodiscard]] Basalt::JSON exportJSON() const;

  [[nodiscard]] constexpr std::int64_t rawValue() const { return rawValue_; }
  [[nodiscard]] constexpr bool isEmpty() const { return rawValue_ == 0; }

  [[nodiscard]] constexpr UserFeatures union_(UserFeatures other) const {
    return UserFeatures(rawValue_ | other.rawValue_);
  }
  [[nodiscard]] constexpr UserFeatures intersection(UserFeatures other) const {
    return UserFeatures(rawValue_ & other.rawValue_);
  }
  [[nodiscard]] constexpr UserFeatures symmetricDifference(UserFeatures other) const {
    return UserFeatures(rawValue_ ^ other.rawValue_);
  }
  [[nodiscard]] constexpr UserFeatures subtracting(UserFeatures other) const {
    return UserFeatures(rawValue_ & ~other.rawValue_);
  }

  /// Whether every bit of `member` is present; the empty set is contained in every set.
  [[nodiscard]] constexpr bool contains(UserFeatures member) const {
    return member.isSubset(*this);
  }
  [[nodiscard]] constexpr bool isSubset(UserFeatures other) const {
    return intersection(other) == *this;
  }
  [[nodiscard]] constexpr bool isSuperset(UserFeatures other) const {
    return other.isSubset(*this);
  }
  [[nodiscard]] constexpr bool isStrictSubset(UserFeatures other) const {
    return isSubset(other) && *this != other;
  }
  [[nodiscard]] constexpr bool isStrictSuperset(UserFeatures other) const {
    return other.isStrictSubset(*this);
  }
  [[nodiscard]] constexpr bool isDisjoint(UserFeatures other) const {
    return intersection(other).isEmpty();
  }

  /// Adds the member; true if some of it was missing before.
  constexpr bool insert(UserFeatures member) {
    const bool isNew = !contains(member);
    *this = union_(member);
    return isNew;
  }
  /// Takes the member out and returns what of it was present; absent when nothing was.
  constexpr std::optional<UserFeatures> remove(UserFeatures member) {
    const UserFeatures present = intersection(member);
    *this = subtracting(member);
    return present.isEmpty() ? std::nullopt : std::optional(present);
  }
  /// Adds the member and returns what of it was present before; absent when nothing was.
  constexpr std::optional<UserFeatures> update(UserFeatures member) {
    const UserFeatures present = intersection(member);
    *this = union_(member);
    return present.isEmpty() ? std::nullopt : std::optional(present);
  }

  constexpr bool operator==(const UserFeatures&) const = default;

 private:
  std::int64_t rawValue_ = 0;
};

inline constexpr UserFeatures UserFeatures::sharing{std::int64_t{0x01}};
inline constexpr UserFeatures UserFeatures::crossPromo{std::int64_t{0x02}};
inline constexpr UserFeatures UserFeatures::achievements{std::int64_t{0x04}};
inline constexpr UserFeatures UserFeatures::irate{std::int64_t{0x08}};
inline constexpr UserFeatures UserFeatures::cleanResultsPromo{std::int64_t{0x10}};

}  // namespace Varnel

template <>
struct std::hash<Varnel::UserFeatures> {
  std::size_t operator()(Varnel::UserFeatures features) const noexcept {
    return std::hash<std::int64_t>{}(features.rawValue());
  }
};
