// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Text/NeutralLocale.h>

#include <locale.h>

namespace Varnel::Platform {
namespace {

// Kept for threads that outlive main.
locale_t neutralLocale() {
  static const locale_t locale = ::newlocale(LC_ALL_MASK, "C", nullptr);
  return locale;
}

}  // namespace

NeutralLocale::NeutralLocale() : previous_(::uselocale(neutralLocale())) {}

NeutralLocale::~NeutralLocale() {
  ::uselocale(static_cast<locale_t>(previous_));
}

}  // namespace Varnel::Platform
