// SPDX-License-Identifier: MIT
#include <orvane-window/Interface/PreferencesDialog.h>

#include <gtkmm/label.h>

#include <set>
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
  addSizes(values.scan.minSize);
  follow(hidden_, !values.scan.skipsHidden, choices_.includesHidden);
  addRow("Preferences_Hidden", "preferences.hidden", hidden_);
  addPeriods(values.period);
  follow(sounds_, values.playsSounds, choices_.playsSounds);
  addRow("Preferences_Sounds", "preferences.sounds", sounds_);
  follow(figures_, values.sendsFigures, choices_.sendsFigures);
  addRow("Preferences_Consent", "preferences.consent", figures_);
  get_content_area()->pack_start(grid_);
  show_all();
}

void PreferencesDialog::addPeriods(SchedulePeriodOption value) {
  for (const SchedulePeriodOption option : SchedulePeriodOption::optionsAvailableToUser())
    period_.append(option.accessibilityIdentifier(), option.description());
  period_.set_active_id(value.accessibilityIdentifier());
  period_.signal_changed().connect([this, kept = value]() mutable {
    const auto chosen = SchedulePeriodOption::withRawValue(period_.get_active_row_number());
    if (!chosen || *chosen == kept) return;
    if (choices_.period(*chosen))
      kept = *chosen;
    else
      period_.set_active_id(kept.accessibilityIdentifier());
  });
  addRow("Preferences_Reminder", "preferences.reminder", period_);
}

// One that was set by other means stands among those to choose from.
void PreferencesDialog::addSizes(std::uint64_t value) {
  std::set<std::uint64_t> sizes{0, 100'000, 1'000'000, 10'000'000, 100'000'000, value};
  for (const std::uint64_t size : sizes)
    minSize_.append(std::to_string(size),
                    size == 0 ? localized("Preferences_AnySize") : sizeText(size));
  minSize_.set_active_id(std::to_string(value));
  minSize_.signal_changed().connect([this, kept = minSize_.get_active_id()]() mutable {
    const Glib::ustring chosen = minSize_.get_active_id();
    if (chosen == kept) return;
    if (choices_.minSize(std::stoull(chosen.raw())))
      kept = chosen;
    else
      minSize_.set_active_id(kept);
  });
  addRow("Preferences_MinSize", "preferences.min-size", minSize_);
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
