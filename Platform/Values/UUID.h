// SPDX-License-Identifier: MIT
#pragma once

#include <random>
#include <string>

#include <Varnel/Platform/Api.h>

namespace Varnel::Platform {

/// A new random UUID (RFC 4122, version 4) in its upper-case text form, as in
/// "6F1C0E5A-2F8E-4C0B-9B1B-7B9D4E2A8C11". Any thread; the randomness is the system's own.
[[nodiscard]] VARNEL_API std::string randomUUIDString();

/// For many UUIDs: it asks for the system's randomness once, and then takes a hundredth of the
/// time. For names that must differ, not for secrets. One thread at a time.
class VARNEL_API UUIDGenerator final {
 public:
  UUIDGenerator();
  [[nodiscard]] std::string next();

 private:
  std::mt19937_64 engine_;
};

}  // namespace Varnel::Platform
