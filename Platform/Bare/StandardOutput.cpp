// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Ports/StandardOutput.h>

#include <signal.h>
#include <unistd.h>

#include <cerrno>
#include <cstdio>

#include <Varnel/Platform/Bare/Adapters.h>
#include <Varnel/Platform/POSIX/StandardStreams.h>
#include <Varnel/Platform/POSIX/SuppressedSignal.h>

namespace Varnel::Platform::Bare {
namespace {

// Writes each text at once, behind what the host has printed: nothing of the framework's own is
// ever left in a buffer, to be lost, written twice after a fork, or written into a broken pipe by
// the C library.
class UnbufferedStream final : public StandardOutput {
 public:
  explicit UnbufferedStream(std::FILE* stream) : stream_(stream) {}

  void print(std::string_view text) override {
    if (!isThere_) return;
    POSIX::SuppressedSignal brokenPipe(SIGPIPE);
    POSIX::SuppressedSignal tooLarge(SIGXFSZ);
    ::flockfile(stream_);
    if (std::fflush(stream_) == 0) write(text);
    ::funlockfile(stream_);
    tooLarge.consume();
    brokenPipe.consume();
  }

 private:
  void write(std::string_view text) const {
    while (!text.empty()) {
      const ssize_t size = ::write(::fileno(stream_), text.data(), text.size());
      if (size < 0 && errno == EINTR) continue;
      if (size <= 0) return;
      text.remove_prefix(static_cast<std::size_t>(size));
    }
  }

  std::FILE* stream_;
  const bool isThere_ = POSIX::wasOpenAtStart(stream_);
};

}  // namespace

std::unique_ptr<StandardOutput> makeStandardOutput() {
  return std::make_unique<UnbufferedStream>(stdout);
}

}  // namespace Varnel::Platform::Bare

namespace Varnel::Platform {

std::unique_ptr<StandardOutput> makeStandardErrorOutput() {
  return std::make_unique<Bare::UnbufferedStream>(stderr);
}

}  // namespace Varnel::Platform
