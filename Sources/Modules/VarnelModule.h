// SPDX-License-Identifier: MIT
#pragma once

#include <memory>
#include <string>

#include <Varnel/Modules/BaseModule.h>
#include <Varnel/Platform/Api.h>

namespace Varnel {

/// The framework itself: its bundle with texts and sounds, and its version.
///
///     auto framework = VarnelModule::instance();
///     framework->version();                       // "0.1.0 (1/undefined)"
///     framework->localizedString("Varnel_Quit");  // in the user's language
///
/// Any thread.
class VARNEL_API VarnelModule final : public BaseModule {
 public:
  /// Logs the framework's version.
  VarnelModule();

  using BaseModule::identifier;

  /// The shared module. The first use makes it and logs it.
  [[nodiscard]] static std::shared_ptr<VarnelModule> instance();
  /// Puts another module in its place; null makes the next reader make a new one.
  static void setInstance(std::shared_ptr<VarnelModule> instance);

  /// "varnel-module".
  [[nodiscard]] std::string identifier() const override;
  /// The framework's resources: `share/varnel-VERSION` of the build folder or of
  /// the installation.
  [[nodiscard]] Bundle fetchBundle() const override;
  [[nodiscard]] std::string typeName() const override;
};

}  // namespace Varnel
