// SPDX-License-Identifier: MIT
#include <Platform/Ports/StandardOutput.h>

#include <cstdio>

#include <Platform/POSIX/Adapters.h>

namespace Varnel::Platform::POSIX {
namespace {

class StandardStream final : public StandardOutput {
 public:
  // fwrite holds the stream's lock, so that entries of several threads stay whole.
  void print(std::string_view text) override {
    (void)std::fwrite(text.data(), 1, text.size(), stdout);
  }
};

}  // namespace

std::unique_ptr<StandardOutput> makeStandardOutput() {
  return std::make_unique<StandardStream>();
}

}  // namespace Varnel::Platform::POSIX
