// SPDX-License-Identifier: MIT
#include <orvane/StandardStreams.h>

#include <fcntl.h>
#include <sys/ioctl.h>
#include <unistd.h>

#include <cerrno>
#include <csignal>
#include <cstdio>
#include <cstdlib>

namespace Orvane {
namespace {

bool ignoredClosedPipes = false;  ///< Before it was this program's to choose.

std::error_code writeAll(std::FILE* stream, std::string_view text) {
  errno = 0;
  const bool isWritten = std::fwrite(text.data(), 1, text.size(), stream) == text.size();
  if (std::fflush(stream) == 0 && isWritten) return {};
  return {errno != 0 ? errno : EIO, std::generic_category()};
}

bool isTerminal(int stream) {
  const char* const type = std::getenv("TERM");
  return ::isatty(stream) == 1 && (type == nullptr || std::string_view(type) != "dumb");
}

std::size_t columnsOf(int stream) {
  ::winsize size{};
  const bool isTold = ::ioctl(stream, TIOCGWINSZ, &size) == 0 && size.ws_col > 0;
  return isTold ? size.ws_col : 80;
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
  ignoredClosedPipes = std::signal(SIGPIPE, SIG_IGN) == SIG_IGN;
}

bool closedPipesEnd() {
  return !ignoredClosedPipes;
}

int endByClosedPipe() {
  (void)std::signal(SIGPIPE, SIG_DFL);
  (void)std::raise(SIGPIPE);
  return 128 + SIGPIPE;
}

std::error_code writeStandardOutput(std::string_view text) {
  return writeAll(stdout, text);
}

void writeStandardError(std::string_view text) {
  (void)writeAll(stderr, text);
}

void writeStandardErrorInHandler(std::string_view text) {
  [[maybe_unused]] const auto written = ::write(STDERR_FILENO, text.data(), text.size());
}

bool isStandardErrorATerminal() {
  return isTerminal(STDERR_FILENO);
}

bool isStandardOutputATerminal() {
  return isTerminal(STDOUT_FILENO);
}

std::size_t standardErrorColumns() {
  return columnsOf(STDERR_FILENO);
}

std::size_t standardOutputColumns() {
  return columnsOf(STDOUT_FILENO);
}

bool refusesColours() {
  const char* const answer = std::getenv("NO_COLOR");
  return answer != nullptr && *answer != '\0';
}

}  // namespace Orvane
