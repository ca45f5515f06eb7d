// SPDX-License-Identifier: MIT
#include <optional>

#include <Tests/Contract/HTTPClientContract.h>
#include <Tests/Support/AnalyticsServer.h>
#include <Varnel/Platform/POSIX/Adapters.h>

namespace Varnel::Platform::Contract {
namespace {

class CurlModule final : public HTTPClientWorld {
 public:
  HTTPClient& client() override { return *client_; }
  std::string serve(const std::vector<std::string>& answers) override {
    return server_.emplace(answers).url();
  }
  std::string nextBody() override { return server_->next().body; }
  void waitForHanging() override { server_->next(); }

 private:
  std::optional<Tests::AnalyticsServer> server_;
  const std::unique_ptr<HTTPClient> client_ = POSIX::makeHTTPClient();
};
INSTANTIATE_TEST_SUITE_P(POSIX, HTTPClientContract, HTTPClientContract::on<CurlModule>());

}  // namespace
}  // namespace Varnel::Platform::Contract
