// SPDX-License-Identifier: MIT
#include <Platform/Ports/StandardOutput.h>

#include <cstdio>

#include <Platform/POSIX/Adapters.h>

namespace Varnel::Platform::POSIX {
namespace {

class StandardStream final : public StandardOutput {
 public:
  explicit StandardStream(std::FILE* stream) : stream_(stream) {}

  // fwrite holds the stream's lock, so that entries of several threads stay whole.
  void print(std::string_view text) override {
    (void)std::fwrite(text.data(), 1, text.size(), stream_);
  }

 private:
  std::FILE* stream_;
};

}  // namespace

std::unique_ptr<StandardOutput> makeStandardOutput() {
  return std::make_unique<StandardStream>(stdout);
}

}  // namespace Varnel::Platform::POSIX

namespace Varnel::Platform {

std::unique_ptr<StandardOutput> makeStandardErrorOutput() {
  return std::make_unique<POSIX::StandardStream>(stderr);
}

}  // namespace Varnel::Platform
