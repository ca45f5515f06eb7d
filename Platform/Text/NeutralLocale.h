// SPDX-License-Identifier: MIT
#pragma once

namespace Varnel::Platform {

/// While it lives, the C library writes and reads numbers on this thread as in the "C" locale,
/// whatever the host has chosen for the process.
///
///     const NeutralLocale neutral;
///     plist_from_xml(…);
class NeutralLocale final {
 public:
  NeutralLocale();
  ~NeutralLocale();
  NeutralLocale(const NeutralLocale&) = delete;
  NeutralLocale& operator=(const NeutralLocale&) = delete;

 private:
  void* const previous_;
};

}  // namespace Varnel::Platform
