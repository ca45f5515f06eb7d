// SPDX-License-Identifier: MIT
#pragma once

#include <Varnel/Platform/Api.h>

namespace Varnel::Platform {

/// The running application as the user sees it. Any thread.
class VARNEL_API Application {
 public:
  virtual ~Application() = default;
  Application& operator=(const Application&) = delete;

  /// Whether the application is in front. Where the system does not tell, the answer is no until
  /// the host calls `setActive`.
  [[nodiscard]] virtual bool isActive() const = 0;

  /// To be called by the host when its windows come to the front or leave it. Has no effect where
  /// the system itself tells.
  virtual void setActive(bool isActive) = 0;
};

}  // namespace Varnel::Platform
