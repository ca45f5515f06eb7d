// SPDX-License-Identifier: MIT
#pragma once

#include <cstdio>

namespace Varnel::Platform::POSIX {

/// Whether the process began with this stream, `stdout` or `stderr`. Where it did not, the stream's
/// number is that of a file which was opened since, the user's document perhaps, and what is
/// printed would stand there. Any thread.
[[nodiscard]] bool wasOpenAtStart(std::FILE* stream);

}  // namespace Varnel::Platform::POSIX
