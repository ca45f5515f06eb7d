// SPDX-License-Identifier: MIT
#include <optional>

#include <Tests/Contract/HTTPClientContract.h>
#include <Tests/Support/AnalyticsServer.h>
#include <Varnel/Platform/POSIX/Adapters.h>

namespace Varnel::Platform::Contract {
namespace {

class CurlModule final : public AdapterColumn<HTTPClientWorld, POSIX::makeHTTPClient> {
 public:
  std::string serve(const std::vector<std::string>& answers) override {
    return server_.emplace(answers).url();
  }
  std::string nextBody() override { return server_->next().body; }
  void waitForHanging() override { server_->next(); }

 private:
  std::optional<Tests::AnalyticsServer> server_;
};
INSTANTIATE_TEST_SUITE_P(POSIX, HTTPClientContract, on<CurlModule>());

}  // namespace
}  // namespace Varnel::Platform::Contract
