// SPDX-License-Identifier: MIT
#pragma once

#include <Varnel/Platform/Text/LocaleLibrary.h>

namespace Varnel::Platform::ICU {

[[nodiscard]] bool hasGregorianCalendar(const std::string& locale);

[[nodiscard]] std::unique_ptr<LocaleLibrary::WallCalendar> makeWallCalendar(
    const std::string& locale);

}  // namespace Varnel::Platform::ICU
