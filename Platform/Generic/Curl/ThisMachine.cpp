// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Generic/Curl/ThisMachine.h>

#include <arpa/inet.h>
#include <netinet/in.h>

#include <string>
#include <string_view>

#include <Varnel/Platform/Values/UniqueHandle.h>

namespace Varnel::Platform {
namespace {

using Text = UniqueHandle<char*, curl_free>;

constexpr unsigned loopbackNetwork = 127;

bool isLoopbackName(std::string_view host) {
  constexpr std::string_view name = "localhost";
  if (host.ends_with('.')) host.remove_suffix(1);
  if (host.size() < name.size()) return false;
  const std::string end(host.substr(host.size() - name.size()));
  host.remove_suffix(name.size());
  return (host.empty() || host.ends_with('.')) && curl_strequal(end.c_str(), name.data());
}

bool isLoopbackAddress(std::string host) {
  in_addr four{};
  if (::inet_pton(AF_INET, host.c_str(), &four) == 1)
    return ntohl(four.s_addr) >> 24 == loopbackNetwork;
  if (!host.starts_with('[') || !host.ends_with(']')) return false;
  host = host.substr(1, host.size() - 2);
  in6_addr six{};
  if (::inet_pton(AF_INET6, host.c_str(), &six) != 1) return false;
  return IN6_IS_ADDR_LOOPBACK(&six) ||
         (IN6_IS_ADDR_V4MAPPED(&six) && six.s6_addr[12] == loopbackNetwork);
}

}  // namespace

bool isOnThisMachine(CURLU* url) {
  char* found = nullptr;
  // The library has brought every way of writing an IPv4 address to the usual one.
  if (curl_url_get(url, CURLUPART_HOST, &found, 0) != CURLUE_OK) return false;
  const Text host(found);
  return isLoopbackName(host.get()) || isLoopbackAddress(host.get());
}

}  // namespace Varnel::Platform
