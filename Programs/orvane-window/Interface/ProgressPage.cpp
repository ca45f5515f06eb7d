// SPDX-License-Identifier: MIT
#include <orvane-window/Interface/ProgressPage.h>

#include <algorithm>

#include <Varnel/GTK3/Identifiers.h>
#include <Varnel/Interface/AccessibleAction.h>
#include <orvane-window/Interface/SetAction.h>
#include <orvane-window/Model/Session.h>
#include <orvane-window/Model/Texts.h>

namespace Orvane {

using Varnel::GTK3::identify;
namespace {

struct Lines {
  std::string title{};
  std::string detail{};
  double done = 0;
  double all = 0;  ///< 0 while that is not known.
};

Lines linesOf(const ScanControl& control) {
  if (control.filesToRead == 0)
    return {localized("Scanning_Walk"),
            localized("Scanning_Found", {countText(control.filesFound)})};
  return {localized("Scanning_Compare"),
          localized("Scanning_Read", {countText(control.filesRead), countText(control.filesToRead),
                                      sizeText(control.bytesRead)}),
          static_cast<double>(control.filesRead), static_cast<double>(control.filesToRead)};
}

Lines linesOf(const MoveProgress& progress, const char* titleKey) {
  Lines lines{.title = localized(titleKey),
              .done = static_cast<double>(progress.done),
              .all = static_cast<double>(progress.all)};
  if (progress.all > 0)
    lines.detail =
        localized("Removing_Progress", {countText(progress.done), countText(progress.all)});
  return lines;
}

Lines linesOf(const Session& session) {
  switch (session.stage()) {
    case Session::Stage::scanning:
      return linesOf(session.scanControl());
    case Session::Stage::removing:
      return linesOf(session.moveProgress(), "Removing");
    case Session::Stage::restoring:
      return linesOf(session.moveProgress(), "Restoring");
    case Session::Stage::planning:
      return linesOf(session.moveProgress(), "Preparing");
    case Session::Stage::exporting:
      return {localized("Exporting")};
    case Session::Stage::choosing:
    case Session::Stage::results:
      break;
  }
  return {};
}

}  // namespace

ProgressPage::ProgressPage() : Gtk::Box(Gtk::ORIENTATION_VERTICAL, 12), stop_(localized("Stop")) {
  set_valign(Gtk::ALIGN_CENTER);
  set_halign(Gtk::ALIGN_CENTER);
  set_border_width(24);
  title_.get_style_context()->add_class("orvane-title");
  detail_.get_style_context()->add_class("dim-label");
  // Figures that change must not move what stands beside them.
  detail_.set_width_chars(52);
  bar_.set_size_request(420, -1);
  bar_.set_pulse_step(0.04);
  setAction(stop_, "win.stop");
  stop_.set_halign(Gtk::ALIGN_CENTER);
  stop_.set_size_request(160, -1);
  stop_.set_margin_top(12);
  identify(title_, "progress.title");
  identify(detail_, "progress.detail");
  identify(bar_, "progress.bar");
  identify(stop_, Varnel::AccessibleAction("stop").buttonIdentifier());
  for (Gtk::Widget* widget : std::initializer_list<Gtk::Widget*>{&title_, &bar_, &detail_, &stop_})
    pack_start(*widget, Gtk::PACK_SHRINK);
  show_all();
}

std::string ProgressPage::refresh(const Session& session) {
  const Lines lines = linesOf(session);
  const std::string title = session.isStopping() ? localized("Stopping") : lines.title;
  if (title_.get_text() != title) title_.set_text(title);
  if (detail_.get_text() != lines.detail) detail_.set_text(lines.detail);
  showShare(lines.done, lines.all);
  return lines.detail.empty() ? title : title + " – " + lines.detail;
}

void ProgressPage::showShare(double done, double all) {
  if (all > 0)
    bar_.set_fraction(std::min(done / all, 1.0));
  else
    bar_.pulse();
}

}  // namespace Orvane
