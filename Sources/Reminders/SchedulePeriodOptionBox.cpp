// SPDX-License-Identifier: MIT
#include <Varnel/Reminders/SchedulePeriodOptionBox.h>

#include <Varnel/Basalt/JSON.h>

namespace Varnel {
namespace {

using Pointer = SchedulePeriodOptionBox::Pointer;
using Case = SchedulePeriodOption::Case;

SchedulePeriodOption leniently(const Basalt::JSON& json) {
  try {
    return SchedulePeriodOption(json);
  } catch (const Basalt::JSONError&) {
    return SchedulePeriodOption::never;
  }
}

template <Case option>
const Pointer& sharedBox() {
  static const Pointer& box =
      *new Pointer(SchedulePeriodOptionBox::make(SchedulePeriodOption(option)));
  return box;
}

}  // namespace

Pointer SchedulePeriodOptionBox::make(SchedulePeriodOption boxed) {
  return std::make_shared<const SchedulePeriodOptionBox>(boxed);
}

SchedulePeriodOptionBox::SchedulePeriodOptionBox(const Basalt::JSON& json)
    : boxed_(leniently(json)) {}

const Pointer& SchedulePeriodOptionBox::default_() {
  return SchedulePeriodOption::default_() == SchedulePeriodOption::never ? neverBox()
                                                                         : onceInTwoWeeksBox();
}

const Pointer& SchedulePeriodOptionBox::neverBox() {
  return sharedBox<Case::never>();
}
const Pointer& SchedulePeriodOptionBox::weeklyBox() {
  return sharedBox<Case::weekly>();
}
const Pointer& SchedulePeriodOptionBox::onceInTwoWeeksBox() {
  return sharedBox<Case::onceInTwoWeeks>();
}
const Pointer& SchedulePeriodOptionBox::monthlyBox() {
  return sharedBox<Case::monthly>();
}
const Pointer& SchedulePeriodOptionBox::onceInThreeMonthsBox() {
  return sharedBox<Case::onceInThreeMonths>();
}
const Pointer& SchedulePeriodOptionBox::onceInSixMonthsBox() {
  return sharedBox<Case::onceInSixMonths>();
}
const Pointer& SchedulePeriodOptionBox::annuallyBox() {
  return sharedBox<Case::annually>();
}

const std::vector<Pointer>& SchedulePeriodOptionBox::optionsAvailableToUser() {
  static const std::vector<Pointer>& boxes = *[] {
    auto* all = new std::vector<Pointer>;
    for (const SchedulePeriodOption option : SchedulePeriodOption::optionsAvailableToUser())
      all->push_back(make(option));
    return all;
  }();
  return boxes;
}

Basalt::JSON SchedulePeriodOptionBox::exportJSON() const {
  return boxed_.exportJSON();
}

}  // namespace Varnel
