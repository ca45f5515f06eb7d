// SPDX-License-Identifier: MIT
#include <orvane-window/Model/Menu.h>

#include <Varnel/Interface/MainMenuAccessibility.h>

namespace Orvane {
namespace {

using Entries = std::vector<MenuEntry>;

const Varnel::MainMenuAccessibility& catalogue() {
  return Varnel::MainMenuAccessibility::instance();
}

Entries orvaneEntries(const MenuFacts& facts) {
  const auto& menu = catalogue().orvane();
  Entries entries{{menu.about(), "About", "app.about", ""}};
  if (facts.features.contains(Varnel::UserFeatures::sharing))
    entries.push_back({menu.tellAFriend(), "TellAFriend", "app.tell-a-friend", ""});
  entries.push_back({menu.preferences(), "Preferences", "app.preferences", "<Primary>comma", true});
  entries.push_back({menu.licenseAgreement(), "License", "app.license", ""});
  entries.push_back({menu.quit(), "Quit", "app.quit", "<Primary>q", true});
  return entries;
}

Entries scanEntries() {
  const auto& menu = catalogue().scan();
  return {{menu.scanForDuplicates(), "Scan", "win.scan", "<Primary>Return"},
          {menu.stopScan(), "StopScan", "win.stop-scan", "<Primary>period"},
          {menu.stopRemoving(), "StopRemoving", "win.stop-removing", ""},
          {menu.startOver(), "StartOver", "win.start-over", "<Primary>n", true},
          {menu.addScanLocation(), "AddFolder", "win.add-folder", "<Primary>o"},
          {menu.rescan(), "Rescan", "win.rescan", "<Primary>r"}};
}

Entries viewEntries() {
  const auto& menu = catalogue().view();
  return {{menu.expandAllEquivalences(), "ExpandAll", "win.expand-all", "<Primary>e"},
          {menu.collapseAllEquivalences(), "CollapseAll", "win.collapse-all", "<Primary><Shift>e"},
          {menu.toggleFullScreen(), "FullScreen", "win.full-screen", "F11", true}};
}

Entries duplicatesEntries() {
  const auto& menu = catalogue().duplicates();
  const auto rule = [&](const char* name, const char* key) {
    return MenuEntry{menu.select() + "." + name, key, "win.select('" + std::string(name) + "')",
                     ""};
  };
  return {{menu.putBackAll(), "PutBack", "win.put-back", "<Primary><Shift>z"},
          {menu.select(),
           "Select",
           "",
           "",
           true,
           {rule("oldest", "Keep_Oldest"), rule("newest", "Keep_Newest"),
            rule("shortest", "Keep_Shortest"), rule("first-folder", "Keep_FirstFolder"),
            rule("none", "SelectNone")}},
          {menu.remove(), "Remove", "win.remove", "<Primary>Delete"},
          {menu.selectDuplicate(), "SelectDuplicate", "win.toggle", "<Primary>d"},
          {menu.quickLook(), "QuickLook", "win.open", "<Primary>y", true},
          {menu.exportSelectedDuplicates(), "ExportSelected", "win.export-selected", "", true},
          {menu.exportEquivalencesJSON(), "ExportJSON", "win.export-json", ""}};
}

Entries helpEntries(const MenuFacts& facts) {
  using Varnel::UserFeatures;
  const auto& menu = catalogue().help();
  Entries entries{{menu.orvaneHelp(), "Help", "app.link('help')", "F1"}};
  if (facts.features.contains(UserFeatures::crossPromo))
    entries.push_back({menu.moreProducts(), "MoreProducts", "app.link('more-products')", "", true});
  entries.push_back({menu.contactSupport(), "ContactSupport", "app.link('support')", "", true});
  entries.push_back({menu.provideFeedback(), "ProvideFeedback", "app.link('feedback')", ""});
  if (facts.features.contains(UserFeatures::irate))
    entries.push_back({menu.rateOnMAS(), "Rate", "app.link('rate')", ""});
  entries.push_back({menu.suggestFeature(), "SuggestFeature", "app.link('suggest')", ""});
  return entries;
}

Entries debugEntries() {
  const auto& menu = catalogue().debug();
  return {{menu.debugAnalytics(), "Analytics", "app.debug('analytics')", ""},
          {menu.printKeyViewLoop(), "Print the Key View Loop", "app.debug('key-view-loop')", ""},
          {menu.crashMe(), "Crash Me", "app.debug('crash')", "", true},
          {menu.raiseException(), "Raise an Exception", "app.debug('exception')", ""}};
}

}  // namespace

std::vector<MenuGroup> mainMenu(const MenuFacts& facts) {
  const auto& menu = catalogue();
  std::vector<MenuGroup> groups{
      {menu.orvane().baseIdentifier(), "", orvaneEntries(facts)},
      {menu.scan().baseIdentifier(), "Menu_Scan", scanEntries()},
      {menu.edit().baseIdentifier(),
       "Menu_Edit",
       {{menu.edit().actionCopy(), "CopyPath", "win.copy", "<Primary>c"}}},
      {menu.view().baseIdentifier(), "Menu_View", viewEntries()},
      {menu.go().baseIdentifier(),
       "Menu_Go",
       {{menu.go().goToSelectedDuplidates(), "NextSelected", "win.next-selected", "<Primary>g"}}},
      {menu.duplicates().baseIdentifier(), "Menu_Duplicates", duplicatesEntries()},
      {menu.window().baseIdentifier(),
       "Menu_Window",
       {{menu.window().minimize(), "Minimize", "win.minimize", "<Primary>m"},
        {menu.window().zoom(), "Zoom", "win.zoom", ""},
        {menu.window().close(), "Close", "win.close", "<Primary>w", true}}},
      {menu.help().baseIdentifier(), "Menu_Help", helpEntries(facts)}};
  if (facts.isDebugMode)
    groups.push_back({menu.debug().baseIdentifier(), "Menu_Debug", debugEntries()});
  return groups;
}

}  // namespace Orvane
