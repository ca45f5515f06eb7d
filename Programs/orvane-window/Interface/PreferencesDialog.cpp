// SPDX-License-Identifier: MIT
#include <orvane-window/Interface/PreferencesDialog.h>

#include <gtkmm/label.h>

#include <string>
#include <utility>

#include <Varnel/GTK3/Identifiers.h>
#include <orvane-window/Model/Texts.h>

namespace Orvane {

using Varnel::GTK3::identify;

using Varnel::SchedulePeriodOption;

PreferencesDialog::PreferencesDialog(Gtk::Window& parent, const Values& values, Choices choices)
    : Gtk::Dialog(localized("Preferences_Title"), parent,
                  Gtk::DIALOG_MODAL | Gtk::DIALOG_DESTROY_WITH_PARENT | Gtk::DIALOG_USE_HEADER_BAR),
      choices_(std::move(choices)) {
  set_resizable(false);
  identify(*this, "preferences");
  grid_.set_row_spacing(18);
  grid_.set_column_spacing(36);
  grid_.set_border_width(24);
  for (const SchedulePeriodOption option : SchedulePeriodOption::optionsAvailableToUser())
    period_.append(option.accessibilityIdentifier(), option.description());
  period_.set_active_id(values.period.accessibilityIdentifier());
  period_.signal_changed().connect([this, kept = values.period]() mutable {
    const auto chosen = SchedulePeriodOption::withRawValue(period_.get_active_row_number());
    if (!chosen || *chosen == kept) return;
    if (choices_.period(*chosen))
      kept = *chosen;
    else
      period_.set_active_id(kept.accessibilityIdentifier());
  });
  addRow("Preferences_Reminder", "preferences.reminder", period_);
  follow(sounds_, values.playsSounds, choices_.playsSounds);
  addRow("Preferences_Sounds", "preferences.sounds", sounds_);
  follow(figures_, values.sendsFigures, choices_.sendsFigures);
  addRow("Preferences_Consent", "preferences.consent", figures_);
  get_content_area()->pack_start(grid_);
  show_all();
}

void PreferencesDialog::follow(Gtk::Switch& toggle, bool value,
                               const std::function<bool(bool)>& choice) {
  toggle.set_active(value);
  toggle.property_active().signal_changed().connect([&toggle, choice, kept = value]() mutable {
    if (toggle.get_active() == kept) return;
    if (choice(toggle.get_active()))
      kept = toggle.get_active();
    else
      toggle.set_active(kept);
  });
}

void PreferencesDialog::addRow(const char* textKey, const char* identifier, Gtk::Widget& widget) {
  auto* label = Gtk::manage(new Gtk::Label(localized(textKey)));
  label->set_xalign(0);
  label->set_hexpand(true);
  label->set_mnemonic_widget(widget);
  widget.set_halign(Gtk::ALIGN_END);
  widget.get_accessible()->set_name(localized(textKey));
  identify(widget, identifier);
  grid_.attach(*label, 0, rows_, 1, 1);
  grid_.attach(widget, 1, rows_++, 1, 1);
}

}  // namespace Orvane
