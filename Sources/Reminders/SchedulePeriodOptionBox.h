// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include <Varnel/Basalt/JSON.h>
#include <Varnel/Platform/Api.h>
#include <Varnel/Reminders/SchedulePeriodOption.h>

namespace Varnel {

/// `SchedulePeriodOption` as an object, for interface code.
///
///     for (const auto& box : SchedulePeriodOptionBox::optionsAvailableToUser())
///       menu.add(box->description(), box);
///
/// Immutable and shared; any thread.
class VARNEL_API SchedulePeriodOptionBox
    : public std::enable_shared_from_this<SchedulePeriodOptionBox> {
 public:
  using Pointer = std::shared_ptr<const SchedulePeriodOptionBox>;

  static constexpr bool canImportJSON = true;
  static constexpr bool canExportJSON = true;
  static constexpr bool canConvertJSON = true;

  [[nodiscard]] static Pointer make(SchedulePeriodOption boxed);

  explicit SchedulePeriodOptionBox(SchedulePeriodOption boxed) : boxed_(boxed) {}
  /// Reads JSON as `SchedulePeriodOption` does, but never fails: a value that it refuses becomes
  /// `never`, so a damaged preference turns the reminder off.
  explicit SchedulePeriodOptionBox(const Basalt::JSON& json);
  virtual ~SchedulePeriodOptionBox() = default;
  SchedulePeriodOptionBox(const SchedulePeriodOptionBox&) = delete;
  SchedulePeriodOptionBox& operator=(const SchedulePeriodOptionBox&) = delete;

  /// The shared box of `SchedulePeriodOption::default_()`.
  [[nodiscard]] static const Pointer& default_();

  // One shared box a case.
  [[nodiscard]] static const Pointer& neverBox();
  [[nodiscard]] static const Pointer& weeklyBox();
  [[nodiscard]] static const Pointer& onceInTwoWeeksBox();
  [[nodiscard]] static const Pointer& monthlyBox();
  [[nodiscard]] static const Pointer& onceInThreeMonthsBox();
  [[nodiscard]] static const Pointer& onceInSixMonthsBox();
  [[nodiscard]] static const Pointer& annuallyBox();

  /// A box for each of `SchedulePeriodOption::optionsAvailableToUser()`, other than the shared
  /// ones.
  [[nodiscard]] static const std::vector<Pointer>& optionsAvailableToUser();

  [[nodiscard]] Basalt::JSON exportJSON() const;

  [[nodiscard]] SchedulePeriodOption boxed() const { return boxed_; }
  /// The raw value.
  [[nodiscard]] std::int64_t value() const { return boxed_.rawValue(); }
  [[nodiscard]] std::size_t hash() const { return std::hash<SchedulePeriodOption>{}(boxed_); }
  [[nodiscard]] std::string description() const { return boxed_.description(); }

  /// The box itself: it never changes. Only for boxes held by a shared pointer.
  [[nodiscard]] Pointer copy() const { return shared_from_this(); }

  bool operator==(const SchedulePeriodOptionBox& other) const { return boxed_ == other.boxed_; }

 private:
  const SchedulePeriodOption boxed_;
};

}  // namespace Varnel
