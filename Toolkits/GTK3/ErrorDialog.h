// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>
#include <functional>
#include <optional>

#include <Varnel/Platform/Api.h>

namespace Gtk {
class Window;
}

namespace Varnel {
class UserErrorType;
struct UserErrorInfo;
}  // namespace Varnel

namespace Varnel::GTK3 {

/// What the user chose in an error's dialog: the place of a recovery option; none when the dialog
/// was closed without one.
using ErrorAnswer = std::function<void(std::optional<std::size_t> option)>;

/// Tells the user of an error in a dialog above the window, and returns at once:
///
///     presentError(window,
///                  {"The folder is gone.", "Choose another folder.", {"Choose…", "Cancel"}},
///                  [this](auto option) { if (option == 0) chooseFolder(); });
///
/// The description is the main sentence, the suggestion the second, and the options are the buttons
/// in their order, of which the first is the default; without options there is a button "OK" in the
/// user's language, which answers none. The texts are plain; bytes that are not UTF-8 are shown as
/// such. The dialog goes with the window, and then there is no answer. On the accessibility bus it
/// is "error-dialog", its buttons "error-dialog.0.button" and so on, its texts
/// "error-dialog.description" and "error-dialog.suggestion". Main thread only.
VARNEL_API void presentError(Gtk::Window& window, const UserErrorInfo& info,
                             ErrorAnswer answer = {});

/// The same for an error that may have something to tell; one that has not shows nothing, and is
/// not answered. False then.
VARNEL_API bool presentError(Gtk::Window& window, const UserErrorType& error,
                             ErrorAnswer answer = {});

}  // namespace Varnel::GTK3
