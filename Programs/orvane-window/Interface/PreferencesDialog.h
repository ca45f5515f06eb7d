// SPDX-License-Identifier: MIT
#pragma once

#include <gtkmm/comboboxtext.h>
#include <gtkmm/dialog.h>
#include <gtkmm/grid.h>
#include <gtkmm/switch.h>

#include <cstdint>
#include <functional>

#include <Scan/ScanRequest.h>
#include <Varnel/Reminders/SchedulePeriodOption.h>

namespace Orvane {

/// What the user may choose once and for all. Each choice counts at once. Main thread.
class PreferencesDialog final : public Gtk::Dialog {
 public:
  struct Values {
    Varnel::SchedulePeriodOption period = Varnel::SchedulePeriodOption::never;
    ScanRequest scan{};
    bool playsSounds = false;
    bool sendsFigures = false;
  };
  /// Each returns false when the choice could not be kept; the dialog then shows the former one.
  struct Choices {
    std::function<bool(Varnel::SchedulePeriodOption)> period;
    std::function<bool(std::uint64_t)> minSize;
    std::function<bool(bool)> includesHidden;
    std::function<bool(bool)> playsSounds;
    std::function<bool(bool)> sendsFigures;
  };

  PreferencesDialog(Gtk::Window& parent, const Values& values, Choices choices);

 private:
  void addRow(const char* textKey, const char* identifier, Gtk::Widget& widget);
  void addPeriods(Varnel::SchedulePeriodOption value);
  void addSizes(std::uint64_t value);
  void follow(Gtk::Switch& toggle, bool value, const std::function<bool(bool)>& choice);

  const Choices choices_;
  Gtk::Grid grid_;
  int rows_ = 0;
  Gtk::ComboBoxText period_;
  Gtk::ComboBoxText minSize_;
  Gtk::Switch hidden_;
  Gtk::Switch sounds_;
  Gtk::Switch figures_;
};

}  // namespace Orvane
