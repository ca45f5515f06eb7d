// SPDX-License-Identifier: MIT
// What parses reads back as itself, whatever the base; queries survive decoding and encoding.
#include <Fuzz/Fuzz.h>
#include <Varnel/Platform/Values/URL.h>
#include <Varnel/Platform/Values/URLQuery.h>

using namespace Varnel::Platform;

static void checkStable(const URL& url) {
  const auto again = URL::parse(url.absoluteString());
  require(again && *again == url);
  require(url.components().text() == url.absoluteString());
  if (const auto query = url.components().query) require(url.withQuery(*query) == url);
  static_cast<void>(url.lastPathComponent());
  static_cast<void>(url.pathExtension());
}

static void fuzz(std::string_view input) {
  const auto [front, back] = cutAt('\n', input);
  const auto base = URL::parse(front);
  if (base) checkStable(*base);
  if (base && base->components().scheme)
    if (const auto url = URL::parse(back, *base)) checkStable(*url);
  if (const auto url = URL::withParts("http", front, "/" + std::string(back), back)) {
    checkStable(*url);
    require(URL::parse(url->absoluteString())->components().host == url->components().host);
  }

  const auto items = decodedURLQuery(input);
  if (items != std::vector<URLQueryItem>{{"", std::nullopt}})
    require(decodedURLQuery(encodedURLQuery(items)) == items);
}
