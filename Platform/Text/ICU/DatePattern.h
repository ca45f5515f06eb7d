// SPDX-License-Identifier: MIT
#pragma once

#include <Varnel/Platform/Text/LocaleLibrary.h>

namespace Varnel::Platform::ICU {

[[nodiscard]] std::unique_ptr<LocaleLibrary::DatePattern> makeDatePattern(
    std::string_view pattern, const std::string& locale, const std::string& zoneIdentifier,
    std::shared_ptr<const TimeZone> zone);

}  // namespace Varnel::Platform::ICU
