// SPDX-License-Identifier: MIT
#pragma once

#include <concepts>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <string_view>
#include <utility>

#include <Varnel/Context/Bundle.h>
#include <Varnel/Platform/Api.h>

namespace Varnel {

/// A part of the suite that has a bundle, a version, texts and identifiers of its own.
///
///     class ReportModule final : public BaseModule {
///      public:
///       ReportModule() { logInitialization(); }  // "Initalizing module 1.4 (210/undefined)"
///       std::string identifier() const override { return "report-module"; }
///       std::string typeName() const override { return "ReportModule"; }
///       using BaseModule::identifier;
///     };
///
/// Making a module ends with a log entry of its version. The constructor of a base class cannot
/// call what its subclass overrides, so the final class's constructor or `makeModule` logs it.
///
/// Any thread. `bundle` and `version` are found by their first reader unless they were set before.
/// The code that finds the bundle must not ask for either.
class VARNEL_API BaseModule {
 public:
  BaseModule();
  virtual ~BaseModule();
  BaseModule(const BaseModule&) = delete;
  BaseModule& operator=(const BaseModule&) = delete;

  /// The module's reverse-DNS base. Every module has its own; calling it on a module without one is
  /// a programming error that stops a debug build.
  [[nodiscard]] virtual std::string identifier() const;

  /// Finds the module's bundle: that of the library or executable that the object's class lies in.
  /// A module says where its bundle is; falling back on this stops a debug build.
  [[nodiscard]] virtual Bundle fetchBundle() const;

  /// "short (bundle/source)" of the bundle's information dictionary, with "undefined" for each
  /// number that is missing; absent without a dictionary.
  [[nodiscard]] virtual std::optional<std::string> fetchVersion() const;

  /// The bundle's text of a key, or the key where it has none.
  [[nodiscard]] virtual std::string localizedString(
      std::string_view key, const std::optional<std::string>& tableName = std::nullopt,
      std::string_view comment = {}) const;

  /// The module's identifier and the suffix joined; empty when either is.
  [[nodiscard]] virtual std::string identifier(std::string_view suffix) const;

  /// The name under which the module logs.
  [[nodiscard]] virtual std::string typeName() const;

  [[nodiscard]] Bundle bundle() const;
  void setBundle(Bundle bundle);

  /// The answer of `fetchVersion()`, or "undefined".
  [[nodiscard]] std::string version() const;
  void setVersion(std::string version);

  /// Logs the module's version, under the name of its type: once, later calls do nothing.
  void logInitialization() const;

 private:
  mutable std::once_flag initializationLogged_;
  mutable std::mutex mutex_;  ///< Owns the two below.
  mutable std::optional<Bundle> bundle_;
  mutable std::optional<std::string> version_;
};

/// Makes a module and logs its version, unless its constructor did.
template <std::derived_from<BaseModule> Module, typename... Arguments>
[[nodiscard]] std::shared_ptr<Module> makeModule(Arguments&&... arguments) {
  auto module = std::make_shared<Module>(std::forward<Arguments>(arguments)...);
  module->logInitialization();
  return module;
}

}  // namespace Varnel
