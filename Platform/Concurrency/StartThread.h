// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <string>
#include <thread>

#include <Varnel/Platform/Api.h>

namespace Varnel::Platform {

/// Starts a thread of the framework, named for debuggers and process listings, where a system may
/// cut the name short. Every thread of ours begins here:
///
///     worker_ = Platform::startThread("volume-watch", [this] { run(); });
///
/// The thread takes no part in the process's signals: all but those of its own faults are blocked,
/// so that only the host gets them, whether it waits for a signal or handles it on a thread of its
/// choice. Threads and programs that are started from this thread inherit that, unless their
/// starter says otherwise.
///
/// Throws `std::system_error` when the system has no more threads. `body` must not throw.
[[nodiscard]] VARNEL_API std::thread startThread(std::string name, std::function<void()> body);

}  // namespace Varnel::Platform
