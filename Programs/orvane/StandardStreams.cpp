// SPDX-License-Identifier: MIT
#include <orvane/StandardStreams.h>

#include <fcntl.h>
#include <unistd.h>

#include <cerrno>
#include <csignal>

namespace Orvane {
namespace {

std::error_code writeAll(int descriptor, std::string_view text) {
  while (!text.empty()) {
    const ssize_t written = ::write(descriptor, text.data(), text.size());
    if (written < 0 && errno == EINTR) continue;
    if (written < 0) return {errno, std::generic_category()};
    text.remove_prefix(static_cast<std::size_t>(written));
  }
  return {};
}

}  // namespace

void reserveStandardStreams() {
  // The lowest free number is taken, so each of these opens fills the gap that was found. The input
  // is opened for writing and the outputs for reading: using them fails as it did before.
  for (int stream = STDIN_FILENO; stream <= STDERR_FILENO; ++stream) {
    if (::fcntl(stream, F_GETFD) < 0)
      (void)::open("/dev/null", stream == STDIN_FILENO ? O_WRONLY : O_RDONLY);
  }
}

void failOnClosedPipes() {
  (void)std::signal(SIGPIPE, SIG_IGN);
}

std::error_code writeStandardOutput(std::string_view text) {
  return writeAll(STDOUT_FILENO, text);
}

void writeStandardError(std::string_view text) {
  (void)writeAll(STDERR_FILENO, text);
}

bool isStandardErrorATerminal() {
  return ::isatty(STDERR_FILENO) == 1;
}

}  // namespace Orvane
