// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Ports/HTTPClient.h>

#include <mutex>

#include <Varnel/Platform/Generic/Curl/Module.h>
#include <Varnel/Platform/POSIX/Adapters.h>
#include <Varnel/Platform/POSIX/Modules.h>

namespace Varnel::Platform::POSIX {
namespace {

// Hands everything to the client of the module, which the first post loads.
class ModuleHTTPClient final : public HTTPClient {
 public:
  Result<HTTPResponse, HTTPFailure> post(const HTTPPost& request, std::stop_token stop) override {
    std::call_once(loaded_, [this] {
      if (void* client = moduleFunction("libvarnel-curl.so", "varnelHTTPClient"))
        client_ = reinterpret_cast<decltype(&varnelHTTPClient)>(client)();
    });
    if (!client_) return HTTPFailure{"The module libvarnel-curl.so is missing."};
    return client_->post(request, std::move(stop));
  }

 private:
  std::once_flag loaded_;
  HTTPClient* client_ = nullptr;
};

}  // namespace

std::unique_ptr<HTTPClient> makeHTTPClient() {
  return std::make_unique<ModuleHTTPClient>();
}

}  // namespace Varnel::Platform::POSIX
