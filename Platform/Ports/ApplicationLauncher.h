// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <optional>
#include <string>

#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/PlatformError.h>

namespace Varnel::Platform {

/// Which application to start, and what for. A plain value.
struct ApplicationLaunch final {
  std::string desktopEntry = {};     ///< Of the application, without its suffix.
  std::string action = {};           ///< Counts where the entry lists it; otherwise there is none.
  std::string activationToken = {};  ///< For a window that is to come to the front; may be empty.
};

/// Starts applications as the desktop does. Main thread only; no operation waits for what it
/// starts.
///
///     launcher.launch({.desktopEntry = "com.quennel.Orvane2"}, [](const auto& error) { … });
class VARNEL_API ApplicationLauncher {
 public:
  virtual ~ApplicationLauncher() = default;

  /// Calls `answer` once, perhaps within this call: with none when the application was started, or
  /// told to come to the front where it runs already.
  virtual void launch(const ApplicationLaunch& launch,
                      std::function<void(const std::optional<PlatformError>& error)> answer) = 0;
};

}  // namespace Varnel::Platform
