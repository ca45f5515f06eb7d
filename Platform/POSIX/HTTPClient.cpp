// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Ports/HTTPClient.h>

#include <mutex>
#include <string>

#include <Varnel/Platform/Generic/Curl/Module.h>
#include <Varnel/Platform/POSIX/Adapters.h>
#include <Varnel/Platform/POSIX/Modules.h>

namespace Varnel::Platform::POSIX {
namespace {

constexpr const char* module = "libvarnel-curl.so";

// Hands everything to the client of the module, which the first post loads.
class ModuleHTTPClient final : public HTTPClient {
 public:
  Result<HTTPResponse, HTTPFailure> post(const HTTPPost& request, std::stop_token stop) override {
    std::call_once(loaded_, [this] {
      const auto client = moduleFunction(module, "varnelHTTPClient");
      if (client)
        client_ = reinterpret_cast<decltype(&varnelHTTPClient)>(*client)();
      else
        problem_ = client.error().text;
    });
    if (!client_) return HTTPFailure{std::string("The module ") + module + " " + problem_ + "."};
    return client_->post(request, std::move(stop));
  }

 private:
  std::once_flag loaded_;
  HTTPClient* client_ = nullptr;
  std::string problem_ = "is of no use";
};

}  // namespace

std::unique_ptr<HTTPClient> makeHTTPClient() {
  return std::make_unique<ModuleHTTPClient>();
}

}  // namespace Varnel::Platform::POSIX
