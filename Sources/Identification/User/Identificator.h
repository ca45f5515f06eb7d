// SPDX-License-Identifier: MIT
#pragma once

#include <string>

#include <Varnel/Platform/Api.h>

namespace Varnel {

/// Supplies the one identifier by which links and analytics recognise this installation.
class VARNEL_API Identificator {
 public:
  virtual ~Identificator() = default;

  /// May read files and wait for a program: keep it off the main thread where that matters.
  [[nodiscard]] virtual std::string uniqueClientIdentifier() const = 0;
};

}  // namespace Varnel
