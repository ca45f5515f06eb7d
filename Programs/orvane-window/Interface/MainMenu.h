// SPDX-License-Identifier: MIT
#pragma once

#include <vector>

#include <Varnel/GTK3/Menus.h>
#include <orvane-window/Model/Menu.h>

namespace Orvane {

/// The entries in the user's language, as the toolkit takes them.
[[nodiscard]] std::vector<Varnel::GTK3::MenuSection> sectionsOf(
    const std::vector<MenuEntry>& entries);

/// The menus likewise.
[[nodiscard]] std::vector<Varnel::GTK3::MenuDescription> descriptionsOf(
    const std::vector<MenuGroup>& groups);

}  // namespace Orvane
