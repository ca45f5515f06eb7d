// SPDX-License-Identifier: MIT
#include <fcntl.h>
#include <unistd.h>

#include <cstdio>

#include <Tests/Contract/StandardOutputContract.h>
#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Platform/Linux/Adapters.h>
#include <Varnel/Platform/Ports/ReadFile.h>

namespace Varnel::Platform::Contract {
namespace {

// A stream of this process, which leads to a file until all has been printed.
class Redirected : public StandardOutputWorld {
 public:
  Redirected(std::FILE* stream, std::unique_ptr<StandardOutput> output)
      : stream_(stream), before_(::dup(::fileno(stream))), output_(std::move(output)) {
    const int file = ::open(path_.c_str(), O_WRONLY | O_CREAT | O_CLOEXEC, 0600);
    std::fflush(stream_);
    ::dup2(file, ::fileno(stream_));
    ::close(file);
  }
  ~Redirected() override { ::close(before_); }

  StandardOutput& output() override { return *output_; }
  std::string printed() override {
    std::fflush(stream_);
    ::dup2(before_, ::fileno(stream_));
    return readFile(path_).valueOr("");
  }

 private:
  const Tests::TemporaryFolder folder_;
  const std::string path_ = folder_.path() / "printed";
  std::FILE* const stream_;
  const int before_;
  const std::unique_ptr<StandardOutput> output_;
};

class Output final : public Redirected {
 public:
  Output() : Redirected(stdout, Linux::makeStandardOutput()) {}
};

class ErrorOutput final : public Redirected {
 public:
  ErrorOutput() : Redirected(stderr, makeStandardErrorOutput()) {}
};
INSTANTIATE_TEST_SUITE_P(LinuxErrors, StandardOutputContract,
                         StandardOutputContract::on<ErrorOutput>());
INSTANTIATE_TEST_SUITE_P(Linux, StandardOutputContract, StandardOutputContract::on<Output>());

}  // namespace
}  // namespace Varnel::Platform::Contract
