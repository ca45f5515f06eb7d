// SPDX-License-Identifier: MIT
#pragma once

namespace Basalt {

/// What the user triggered an action with.
enum class RouterActionSenderKind {
  touchBar,
  keyboardShortcut,
  menuItem,
  button,
  automatic,  ///< Nobody did; the application acted by itself.
};

}  // namespace Basalt
