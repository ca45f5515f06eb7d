// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Concurrency/CurrentThread.h>

namespace Varnel::Platform {

// POSIX knows neither names of threads nor threads that are less urgent than others.
void nameCurrentThread(std::string_view) {}
void setCurrentThreadQuality(QualityOfService) {}

}  // namespace Varnel::Platform
