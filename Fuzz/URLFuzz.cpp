// SPDX-License-Identifier: MIT
// What parses reads back as itself, whatever the base; queries survive decoding and encoding.
#include <cstdint>
#include <cstdlib>
#include <string_view>

#include <Varnel/Platform/Values/URL.h>
#include <Varnel/Platform/Values/URLQuery.h>

using namespace Varnel::Platform;

namespace {

void require(bool holds) {
  if (!holds) std::abort();
}

void checkStable(const URL& url) {
  const auto again = URL::parse(url.absoluteString());
  require(again && *again == url);
  require(url.components().text() == url.absoluteString());
  if (const auto query = url.components().query) require(url.withQuery(*query) == url);
  static_cast<void>(url.lastPathComponent());
  static_cast<void>(url.pathExtension());
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string_view text(reinterpret_cast<const char*>(data), size);
  const std::string_view front = text.substr(0, text.find('\n'));
  const std::string_view back = front.size() < size ? text.substr(front.size() + 1) : "";

  const auto base = URL::parse(front);
  if (base) checkStable(*base);
  if (base && base->components().scheme)
    if (const auto url = URL::parse(back, *base)) checkStable(*url);
  if (const auto url = URL::withParts("http", front, "/" + std::string(back), back)) {
    checkStable(*url);
    require(URL::parse(url->absoluteString())->components().host == url->components().host);
  }

  const auto items = decodedURLQuery(text);
  if (items != std::vector<URLQueryItem>{{"", std::nullopt}})
    require(decodedURLQuery(encodedURLQuery(items)) == items);
  return 0;
}
