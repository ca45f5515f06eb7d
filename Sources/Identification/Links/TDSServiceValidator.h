// SPDX-License-Identifier: MIT
#pragma once

#include <Varnel/Identification/Links/TDSQueryItem.h>
#include <Varnel/Platform/Api.h>

namespace Varnel {

/// A host's veto over single parameters of its links.
class VARNEL_API TDSServiceValidator {
 public:
  virtual ~TDSServiceValidator() = default;

  /// Whether the item goes into the link. Called on the thread that builds the link.
  [[nodiscard]] virtual bool validateQueryItem(const TDSQueryItem& item) = 0;
};

}  // namespace Varnel
