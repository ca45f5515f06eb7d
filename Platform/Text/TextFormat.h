// SPDX-License-Identifier: MIT
#pragma once

#include <initializer_list>
#include <string>
#include <string_view>

#include <Varnel/Platform/Api.h>

namespace Varnel::Platform {

/// Puts texts into a format: "%@" is the next of them, "%2$@" the second, "%%" a percent sign.
///
///     formatted("%1$@ of 100 %%", {"3"});  // "3 of 100 %"
///
/// A text that is missing shows as "(null)"; any other "%" stands for itself. Any thread.
[[nodiscard]] VARNEL_API std::string formatted(std::string_view format,
                                               std::initializer_list<std::string_view> texts);

}  // namespace Varnel::Platform
