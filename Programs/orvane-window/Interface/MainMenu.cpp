// SPDX-License-Identifier: MIT
#include <orvane-window/Interface/MainMenu.h>

#include <Varnel/Context/Globals.h>
#include <orvane-window/Model/Texts.h>

namespace Orvane {

using Varnel::GTK3::MenuDescription;
using Varnel::GTK3::MenuSection;

std::vector<MenuSection> sectionsOf(const std::vector<MenuEntry>& entries) {
  std::vector<MenuSection> sections;
  for (const MenuEntry& entry : entries) {
    if (sections.empty() || entry.startsSection) sections.emplace_back();
    sections.back().push_back({.identifier = entry.identifier,
                               .title = localized(entry.textKey),
                               .action = entry.action,
                               .submenu = sectionsOf(entry.submenu)});
    if (!entry.accelerator.empty()) sections.back().back().accelerators = {entry.accelerator};
  }
  return sections;
}

std::vector<MenuDescription> descriptionsOf(const std::vector<MenuGroup>& groups) {
  std::vector<MenuDescription> descriptions;
  descriptions.reserve(groups.size());
  for (const MenuGroup& group : groups)
    descriptions.push_back({.identifier = group.identifier,
                            .title = group.textKey.empty() ? Varnel::Globals::applicationName()
                                                           : localized(group.textKey),
                            .sections = sectionsOf(group.entries)});
  return descriptions;
}

}  // namespace Orvane
