// SPDX-License-Identifier: MIT
#include <Varnel/Platform/POSIX/StandardStreams.h>

#include <fcntl.h>
#include <unistd.h>

namespace Varnel::Platform::POSIX {
namespace {

struct Streams {
  bool hasOutput = ::fcntl(STDOUT_FILENO, F_GETFD) >= 0;
  bool hasError = ::fcntl(STDERR_FILENO, F_GETFD) >= 0;
};

const Streams& streamsAtStart() {
  static const Streams streams;
  return streams;
}

// Looks while the library is loaded, when the program has not opened a file yet.
[[maybe_unused]] const Streams& seenInTime = streamsAtStart();

}  // namespace

bool wasOpenAtStart(std::FILE* stream) {
  return stream == stderr ? streamsAtStart().hasError : streamsAtStart().hasOutput;
}

}  // namespace Varnel::Platform::POSIX
