// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Concurrency/ForkedChild.h>

#include <pthread.h>

namespace Varnel::Platform {

void callInForkedChildren(void (*function)()) {
  ::pthread_atfork(nullptr, nullptr, function);
}

}  // namespace Varnel::Platform
