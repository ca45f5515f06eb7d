// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <utility>

#include <Varnel/Platform/Api.h>

namespace Varnel {

/// An action that is offered both as a button and as a menu item, with the identifiers by which
/// interface automation finds them:
///
///     const AccessibleAction remove("remove");
///     remove.buttonIdentifier();    // "remove.button"
///     remove.menuItemIdentifier();  // "remove.menu-item"
///
/// An immutable value; all are empty if the identifier is. Any thread.
class VARNEL_API AccessibleAction final {
 public:
  explicit AccessibleAction(std::string identifier) : identifier_(std::move(identifier)) {}

  [[nodiscard]] const std::string& identifier() const { return identifier_; }
  [[nodiscard]] std::string buttonIdentifier() const;
  [[nodiscard]] std::string menuItemIdentifier() const;

 private:
  std::string identifier_;
};

}  // namespace Varnel
