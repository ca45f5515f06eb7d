// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Text/LocaleLibrary.h>

#include <string>

#include <Varnel/Platform/POSIX/Adapters.h>
#include <Varnel/Platform/POSIX/Modules.h>
#include <Varnel/Platform/Ports/SystemLog.h>
#include <Varnel/Platform/Text/ICU/Module.h>

namespace Varnel::Platform {

const LocaleLibrary* localeLibrary() {
  static const LocaleLibrary* const library = []() -> const LocaleLibrary* {
    constexpr const char* module = "libvarnel-icu.so";
    const auto function = POSIX::moduleFunction(module, "varnelLocaleLibrary");
    if (function) return reinterpret_cast<decltype(&varnelLocaleLibrary)>(*function)();
    POSIX::makeSystemLog()->write(
        std::string(
            "There will be no calendars, and dates and numbers of no language: the module ") +
        module + " " + function.error().text + ".");
    return nullptr;
  }();
  return library;
}

}  // namespace Varnel::Platform
