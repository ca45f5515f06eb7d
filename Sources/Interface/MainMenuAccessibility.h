// SPDX-License-Identifier: MIT
#pragma once

#include <array>
#include <string>
#include <utility>
#include <vector>

#include <Varnel/Basalt/Identifier.h>
#include <Varnel/Interface/MenuItemGroup.h>

namespace Varnel {

/// The identifiers of the main menu, by which interface automation finds an item whatever the
/// language of the interface. The host assigns them to its menu items:
///
///     const auto& menu = MainMenuAccessibility::instance();
///     const std::string copy = menu.edit().actionCopy();  // "main-menu.edit.action-copy"
///
/// This is the one place that lists them. Names are published: hosts and their automation scripts
/// refer to them, misspelt ones ("Duplidates", "bringAllToFrong", "putBackAll") included. Any
/// thread; the catalogue does not change. Neither copied nor moved.
///
/// The catalogue is compiled into each program that uses it. Nothing of it crosses the library's
/// boundary, so it can grow without breaking a host.
class MainMenuAccessibility final {
 public:
  class Orvane final : public MenuItemGroup {
   public:
    using MenuItemGroup::MenuItemGroup;

    const Item about{*this, "about"};
    const Item tellAFriend{*this, "tell-a-friend"};
    const Item subscribe{*this, "subscribe"};
    const Item checkForUpdates{*this, "check-for-updates"};
    const Item preferences{*this, "preferences"};
    const Item licenseAgreement{*this, "license-agreement"};
    const Item services{*this, "services"};
    const Item hideOrvane{*this, "hide-orvane"};
    const Item hideOthers{*this, "hide-others"};
    const Item showAll{*this, "show-all"};
    const Item quit{*this, "quit"};
  };

  class Scan final : public MenuItemGroup {
   public:
    using MenuItemGroup::MenuItemGroup;

    const Item scanForDuplicates{*this, "scan-for-duplicates"};
    const Item stopScan{*this, "stop-scan"};
    const Item stopRemoving{*this, "stop-removing"};
    const Item startOver{*this, "start-over"};
    const Item addScanLocation{*this, "add-scan-location"};
    const Item rescan{*this, "rescan"};
  };

  class Edit final : public MenuItemGroup {
   public:
    using MenuItemGroup::MenuItemGroup;

    const Item undo{*this, "undo"};
    const Item redo{*this, "redo"};
    const Item cut{*this, "cut"};
    const Item actionCopy{*this, "action-copy"};
    const Item paste{*this, "paste"};
    const Item pasteAndMatchStyle{*this, "paste-and-match-style"};
    const Item delete_{*this, "delete"};
    const Item selectAll{*this, "select-all"};
  };

  class View final : public MenuItemGroup {
   public:
    using MenuItemGroup::MenuItemGroup;

    const Item switchToGridView{*this, "switch-to-grid-view"};
    const Item switchToListView{*this, "switch-to-list-view"};
    const Item expandAllEquivalences{*this, "expand-all-equivalences"};
    const Item collapseAllEquivalences{*this, "collapse-all-equivalences"};
    const Item toggleFullScreen{*this, "toggle-full-screen"};
  };

  class Go final : public MenuItemGroup {
   public:
    using MenuItemGroup::MenuItemGroup;

    const Item showBriefScanResults{*this, "show-brief-scan-results"};
    const Item showCleanResults{*this, "show-clean-results"};
    const Item showDetailedScanResults{*this, "show-detailed-scan-results"};
    const Item goToExactDuplidates{*this, "go-to-exact-duplicates"};
    const Item goToSimilarDuplidates{*this, "go-to-similar-duplicates"};
    const Item goToSelectedDuplidates{*this, "go-to-selected-duplicates"};
  };

  class Duplicates final : public MenuItemGroup {
   public:
    using MenuItemGroup::MenuItemGroup;

    const Item putBackAll{*this, "putBackAll"};
    const Item select{*this, "select"};
    const Item remove{*this, "remove"};
    const Item selectDuplicate{*this, "select-duplicate"};
    const Item quickLook{*this, "quick-look"};
    const Item exportSelectedDuplicates{*this, "export-selected-duplicates"};
    const Item exportEquivalencesJSON{*this, "export-equivalences-json"};
  };

  class Window final : public MenuItemGroup {
   public:
    using MenuItemGroup::MenuItemGroup;

    const Item minimize{*this, "minimize"};
    const Item zoom{*this, "zoom"};
    const Item bringAllToFrong{*this, "bring-all-to-front"};
    const Item close{*this, "close"};
  };

  class Help final : public MenuItemGroup {
   public:
    using MenuItemGroup::MenuItemGroup;

    const Item orvaneHelp{*this, "orvane-help"};
    const Item showIntro{*this, "show-intro"};
    const Item moreProducts{*this, "more-products"};
    const Item contactSupport{*this, "contact-support"};
    const Item provideFeedback{*this, "provide-feedback"};
    const Item rateOnMAS{*this, "rate-on-mas"};
    const Item suggestFeature{*this, "suggest-feature"};
  };

  class Debug final : public MenuItemGroup {
   public:
    using MenuItemGroup::MenuItemGroup;

    const Item debugAnalytics{*this, "debug-analytics"};
    const Item debugActivity{*this, "debug-activity"};
    const Item printKeyViewLoop{*this, "print-key-view-loop"};
    const Item crashMe{*this, "crash-me"};
    const Item raiseException{*this, "raise-exception"};
    const Item printAchievements{*this, "print-achievements"};
    const Item showPhotosCleaningTutorial{*this, "show-photos-cleaning-tutorial"};
  };

  /// The shared catalogue, whose base identifier is "main-menu".
  [[nodiscard]] static const MainMenuAccessibility& instance() {
    static const MainMenuAccessibility& catalogue = *new MainMenuAccessibility("main-menu");
    return catalogue;
  }

  /// A catalogue whose identifiers all extend `baseIdentifier`; they are empty if that is.
  explicit MainMenuAccessibility(std::string baseIdentifier)
      : baseIdentifier_(std::move(baseIdentifier)) {}

  [[nodiscard]] const std::string& baseIdentifier() const { return baseIdentifier_; }

  [[nodiscard]] const Orvane& orvane() const { return orvane_; }
  [[nodiscard]] const Scan& scan() const { return scan_; }
  [[nodiscard]] const Edit& edit() const { return edit_; }
  [[nodiscard]] const View& view() const { return view_; }
  [[nodiscard]] const Go& go() const { return go_; }
  [[nodiscard]] const Duplicates& duplicates() const { return duplicates_; }
  [[nodiscard]] const Window& window() const { return window_; }
  [[nodiscard]] const Help& help() const { return help_; }
  [[nodiscard]] const Debug& debug() const { return debug_; }

  /// Every group, in the order of the menus.
  [[nodiscard]] std::array<const MenuItemGroup*, 9> groups() const {
    return {&orvane_, &scan_, &edit_, &view_, &go_, &duplicates_, &window_, &help_, &debug_};
  }
  /// The identifier of every item, menu by menu.
  [[nodiscard]] std::vector<std::string> identifiers() const {
    std::vector<std::string> identifiers;
    for (const MenuItemGroup* group : groups())
      for (const MenuItemGroup::Item* item : group->items()) identifiers.push_back((*item)());
    return identifiers;
  }

 private:
  [[nodiscard]] std::string of(const char* menu) const {
    return Basalt::identifier(baseIdentifier_, menu);
  }

  const std::string baseIdentifier_;
  const Orvane orvane_{of("orvane")};
  const Scan scan_{of("scan")};
  const Edit edit_{of("edit")};
  const View view_{of("view")};
  const Go go_{of("go")};
  const Duplicates duplicates_{of("duplicates")};
  const Window window_{of("window")};
  const Help help_{of("help")};
  const Debug debug_{of("debug")};
};

}  // namespace Varnel
