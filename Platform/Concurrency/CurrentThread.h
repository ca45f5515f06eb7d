// SPDX-License-Identifier: MIT
#pragma once

#include <string_view>

#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/QualityOfService.h>

namespace Varnel::Platform {

/// Names the calling thread for debuggers and process listings; a system may cut the name short.
VARNEL_API void nameCurrentThread(std::string_view name);

/// Lets the system's scheduler know how urgent the calling thread's work is. A thread can always
/// become less urgent. Where the system does not let it become more urgent again, it stays as it
/// is.
VARNEL_API void setCurrentThreadQuality(QualityOfService quality);

}  // namespace Varnel::Platform
