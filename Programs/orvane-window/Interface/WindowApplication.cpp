// SPDX-License-Identifier: MIT
#include <orvane-window/Interface/WindowApplication.h>

#include <glibmm/main.h>
#include <gtkmm/cssprovider.h>

#include <cstdlib>
#include <fstream>
#include <iostream>
#include <sstream>
#include <stdexcept>

#include <Varnel/Context/Bundle.h>
#include <Varnel/Context/Globals.h>
#include <Varnel/Context/TargetKind.h>
#include <Varnel/GTK3/OpenURL.h>
#include <Varnel/Identification/Links/TDSService.h>
#include <Varnel/Identification/User/UserIdentificationInfo.h>
#include <Varnel/Identification/User/UserIdentificator.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <orvane-window/Interface/PreferencesDialog.h>
#include <orvane-window/Interface/Questions.h>
#include <orvane-window/Model/Preferences.h>
#include <orvane-window/Model/Texts.h>
#include <orvane/AnalyticsConsent.h>
#include <orvane/Console.h>
#include <orvane/ScanAnalytics.h>

namespace Orvane {
namespace {

using Tallyhouse::Consent;

constexpr const char* style = ".orvane-title { font-size: 150%; font-weight: bold; }";

void printKeyViewLoop(Gtk::Widget& widget, int depth) {
  if (!widget.get_mapped()) return;
  if (widget.get_can_focus()) {
    const char* identifier = atk_object_get_accessible_id(widget.get_accessible()->gobj());
    std::cerr << std::string(static_cast<std::size_t>(depth), ' ') << widget.get_name() << " "
              << (identifier ? identifier : "") << "\n";
  }
  if (auto* container = dynamic_cast<Gtk::Container*>(&widget))
    for (Gtk::Widget* child : container->get_children()) printKeyViewLoop(*child, depth + 1);
}

}  // namespace

Glib::RefPtr<WindowApplication> WindowApplication::create(Console& console) {
  return Glib::RefPtr<WindowApplication>(new WindowApplication(console));
}

WindowApplication::WindowApplication(Console& console)
    : Gtk::Application(Varnel::TargetKind::current().bundleID(), Gio::APPLICATION_HANDLES_OPEN),
      console_(console) {
  g_set_application_name(Varnel::Globals::applicationName().c_str());
  add_main_option_entry(OPTION_TYPE_BOOL, "turn-times", '\0',
                        "Measure the turns of the main loop and print them at the end");
  add_main_option_entry(OPTION_TYPE_STRING, "analytics", '\0',
                        "Where events go, if the user has agreed", "URL");
  routing_.emplace(*this, [this](Varnel::UserNotificationRouter& router) {
    reminding_ = std::make_unique<Reminding>(router, console_, [this](const auto& token) {
      withWindow([token](MainWindow& window) { window.suggestScan(token); });
    });
  });
  signal_handle_local_options().connect(sigc::mem_fun(*this, &WindowApplication::takeOptions),
                                        false);
  signal_shutdown().connect(sigc::mem_fun(*this, &WindowApplication::shutDown), false);
}

WindowApplication::~WindowApplication() = default;

int WindowApplication::takeOptions(const Glib::RefPtr<Glib::VariantDict>& options) {
  bool measures = false;
  if (options->lookup_value("turn-times", measures) && measures) turnTimes_.emplace();
  Glib::ustring endpoint;
  if (options->lookup_value("analytics", endpoint)) {
    if (!ScanAnalytics::isEndpoint(endpoint)) {
      console_.complain("events cannot be sent to \"" + endpoint.raw() + "\"");
      return 2;
    }
    analyticsEndpoint_ = endpoint;
  }
  return -1;
}

void WindowApplication::on_startup() {
  Gtk::Application::on_startup();
  Gtk::Window::set_default_icon_name(Varnel::TargetKind::current().bundleID());
  const auto css = Gtk::CssProvider::create();
  css->load_from_data(style);
  if (const auto screen = Gdk::Screen::get_default())
    Gtk::StyleContext::add_provider_for_screen(screen, css,
                                               GTK_STYLE_PROVIDER_PRIORITY_APPLICATION);
  engine_ = std::make_unique<SystemEngine>(console_, analyticsEndpoint_);
  auto& mainQueue = Varnel::Platform::processPorts().mainQueue.get();
  work_ = std::make_unique<ThreadBackground>(mainQueue);
  links_ = std::make_unique<ThreadBackground>(mainQueue);
  sounds_ = std::make_unique<Varnel::SoundEngine>();
  sounds_->setSoundsEnabled(Preferences::playsSounds());
  addActions();
}

MainWindow& WindowApplication::window() {
  if (window_) return *window_;
  window_ = std::make_unique<MainWindow>(
      *this, Session::Ports{*engine_, *work_},
      MainWindow::Application{.scanned =
                                  [this](const Session& session) {
                                    sounds_->play(Varnel::Sound::scanComplete);
                                    reminding_->schedule(session.list()->duplicates().bytes);
                                  },
                              .moved =
                                  [this](const Session& session) {
                                    sounds_->play(Varnel::Sound::cleanComplete);
                                    if (session.list())
                                      reminding_->schedule(session.list()->duplicates().bytes);
                                  },
                              .asksConsent = [] { return storedConsent() == Consent::notAsked; },
                              .consented =
                                  [this](bool isGranted) {
                                    static_cast<void>(storeConsent(
                                        isGranted ? Consent::granted : Consent::refused, console_));
                                  }});
  add_window(*window_);
  return *window_;
}

MainWindow& WindowApplication::shownWindow() {
  if (!window().get_visible()) window().comeForward();
  return window();
}

void WindowApplication::withWindow(std::function<void(MainWindow&)> act) {
  if (window_) return act(*window_);
  // The toolkit's start and the window together would be too long a turn of the main loop.
  hold();
  Glib::signal_idle().connect_once([this, act = std::move(act)] {
    act(window());
    release();
  });
}

void WindowApplication::on_activate() {
  withWindow([](MainWindow& window) { window.comeForward(); });
}

void WindowApplication::on_open(const type_vec_files& files, const Glib::ustring&) {
  std::vector<std::string> folders;
  for (const auto& file : files) folders.push_back(file->get_path());
  withWindow([folders](MainWindow& window) {
    window.addFolders(folders);
    window.comeForward();
  });
}

// What is being moved comes to its end first: the window's session asks for that.
void WindowApplication::shutDown() {
  window_.reset();
  work_.reset();
  links_.reset();
  reminding_.reset();
  if (turnTimes_) std::cerr << turnTimes_->text();
}

void WindowApplication::addActions() {
  add_action("about", [this] { showAbout(shownWindow()); });
  add_action("tell-a-friend", [this] { openLink("tell-a-friend"); });
  add_action("preferences", [this] { showPreferences(); });
  add_action("license", [this] { showLicense(); });
  add_action("quit", [this] {
    if (window_) window_->hide();
    quit();
  });
  const auto add = [this](const char* name, auto act) {
    const auto action = Gio::SimpleAction::create(name, Glib::VARIANT_TYPE_STRING);
    action->signal_activate().connect([act](const Glib::VariantBase& value) {
      act(Glib::VariantBase::cast_dynamic<Glib::Variant<Glib::ustring>>(value).get());
    });
    add_action(action);
  };
  add("link", [this](const std::string& name) { openLink(name); });
  if (Varnel::Globals::isDebugMode())
    add("debug", [this](const std::string& name) { debug(name); });
}

bool WindowApplication::kept(const std::optional<Varnel::Platform::PlatformError>& failure) {
  if (failure)
    showProblem(shownWindow(), localized("Error_NotKept"), failure->localizedDescription());
  return !failure;
}

void WindowApplication::showPreferences() {
  const auto told = [this](bool isKept) {
    if (!isKept) showProblem(shownWindow(), localized("Error_NotKept"), "");
    return isKept;
  };
  const auto dialog = std::make_shared<PreferencesDialog>(
      shownWindow(),
      PreferencesDialog::Values{.period = reminding_->period(),
                                .scan = Preferences::scanRequest(),
                                .playsSounds = Preferences::playsSounds(),
                                .sendsFigures = storedConsent() == Consent::granted},
      PreferencesDialog::Choices{
          .period = [this, told](auto period) { return told(reminding_->setPeriod(period)); },
          .minSize = [this](auto bytes) { return kept(Preferences::setMinSize(bytes)); },
          .includesHidden =
              [this](bool includes) { return kept(Preferences::setSkipsHidden(!includes)); },
          .playsSounds =
              [this](bool plays) {
                if (!kept(Preferences::setPlaysSounds(plays))) return false;
                sounds_->setSoundsEnabled(plays);
                return true;
              },
          .sendsFigures =
              [this, told](bool sends) {
                return told(storeConsent(sends ? Consent::granted : Consent::refused, console_));
              }});
  showUntilAnswered(dialog);
}

void WindowApplication::showLicense() {
  std::ostringstream text;
  if (const auto path = Varnel::Bundle::main().resourcePath("LICENSE"))
    text << std::ifstream(*path).rdbuf();
  showText(shownWindow(), localized("License"), text.str());
}

// A link tells who follows it, and finding that out may take time.
void WindowApplication::openLink(const std::string& name) {
  links_->start([this, name] {
    const Varnel::TDSService service(
        std::make_shared<Varnel::TDSConfiguration>("Orvane", "orvane2"),
        std::make_shared<Varnel::UserIdentificationInfo>(
            std::make_shared<Varnel::UserIdentificator>()));
    const auto link = service.buildURL(name, {});
    return [this, name, link] {
      if (link) return Varnel::GTK3::openURL(shownWindow(), *link);
      showProblem(shownWindow(), localized("Error_Open"), name);
    };
  });
}

void WindowApplication::debug(const std::string& name) {
  if (name == "analytics")
    showText(shownWindow(), "Analytics", std::to_string(ScanAnalytics::waitingEvents()));
  if (name == "key-view-loop") printKeyViewLoop(shownWindow(), 0);
  if (name == "crash") std::abort();
  if (name == "exception") throw std::runtime_error("raised by the menu");
}

}  // namespace Orvane
