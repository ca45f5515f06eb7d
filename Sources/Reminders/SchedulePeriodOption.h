// SPDX-License-Identifier: MIT
#pragma once

#include <array>
#include <cstdint>
#include <functional>
#include <optional>
#include <string>

#include <Varnel/Basalt/JSON.h>
#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/DateComponents.h>

namespace Varnel::Platform {
class Calendar;
}

namespace Varnel {

/// How often the user wants to be reminded.
///
///     const auto period = SchedulePeriodOption(Basalt::parseJSON(R"({"kind": "monthly"})"));
///     switch (period.case_()) { case SchedulePeriodOption::Case::weekly: … }
///
/// The analytics identifiers say "Once in …", the keys of the texts "Once In …": both are
/// published. As JSON it is an object such as {"kind": "monthly"}. A value; any thread.
class VARNEL_API SchedulePeriodOption final {
 public:
  static constexpr bool canImportJSON = true;
  static constexpr bool canExportJSON = true;
  static constexpr bool canConvertJSON = true;
  static constexpr bool canImportJSONObject = true;

  enum class Case : std::int64_t {
    never,
    weekly,
    onceInTwoWeeks,
    monthly,
    onceInThreeMonths,
    onceInSixMonths,
    annually,
  };

  static const SchedulePeriodOption never;
  static const SchedulePeriodOption weekly;
  static const SchedulePeriodOption onceInTwoWeeks;
  static const SchedulePeriodOption monthly;
  static const SchedulePeriodOption onceInThreeMonths;
  static const SchedulePeriodOption onceInSixMonths;
  static const SchedulePeriodOption annually;

  constexpr explicit SchedulePeriodOption(Case option) : option_(option) {}

  /// The option of a raw value from 0 to 6.
  [[nodiscard]] static std::optional<SchedulePeriodOption> withRawValue(std::int64_t rawValue);

  /// Reads a JSON object whose "kind" is the name of a case, or "default" for `default_()`. Throws
  /// `Basalt::JSONError`: of kind `message` for another name, else what the import of a string
  /// throws.
  explicit SchedulePeriodOption(const Basalt::JSON& jsonObject);

  /// The product's own choice: never in the subscription store's edition, else once in two weeks.
  [[nodiscard]] static SchedulePeriodOption default_();

  /// All seven in the order of their raw values, as menus list them.
  [[nodiscard]] static const std::array<SchedulePeriodOption, 7>& optionsAvailableToUser();

  [[nodiscard]] Basalt::JSON exportJSONObject() const;
  [[nodiscard]] Basalt::JSON exportJSON() const;

  [[nodiscard]] constexpr Case case_() const { return option_; }
  [[nodiscard]] constexpr std::int64_t rawValue() const {
    return static_cast<std::int64_t>(option_);
  }

  /// The name for the user, in the user's language.
  [[nodiscard]] std::string description() const;
  /// The name of the case ("onceInTwoWeeks").
  [[nodiscard]] std::string accessibilityIdentifier() const;
  /// The name for analytics ("Once in Two Weeks").
  [[nodiscard]] std::string analyticsIdentifier() const;

  /// The interval, in one unit; a thousand years stand for never. Weeks are as long as the user's
  /// calendar has them; a calendar without weeks stops the process.
  [[nodiscard]] Platform::DateComponents repeatInterval() const;
  [[nodiscard]] Platform::DateComponents repeatInterval(const Platform::Calendar& calendar) const;

  constexpr bool operator==(const SchedulePeriodOption&) const = default;

 private:
  Case option_;
};

inline constexpr SchedulePeriodOption SchedulePeriodOption::never{Case::never};
inline constexpr SchedulePeriodOption SchedulePeriodOption::weekly{Case::weekly};
inline constexpr SchedulePeriodOption SchedulePeriodOption::onceInTwoWeeks{Case::onceInTwoWeeks};
inline constexpr SchedulePeriodOption SchedulePeriodOption::monthly{Case::monthly};
inline constexpr SchedulePeriodOption SchedulePeriodOption::onceInThreeMonths{
    Case::onceInThreeMonths};
inline constexpr SchedulePeriodOption SchedulePeriodOption::onceInSixMonths{Case::onceInSixMonths};
inline constexpr SchedulePeriodOption SchedulePeriodOption::annually{Case::annually};

}  // namespace Varnel

template <>
struct std::hash<Varnel::SchedulePeriodOption> {
  std::size_t operator()(Varnel::SchedulePeriodOption option) const noexcept {
    return static_cast<std::size_t>(option.rawValue());
  }
};
