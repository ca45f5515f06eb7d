// SPDX-License-Identifier: MIT
// The time to compose a link's nine query items, beside uriparser's time for the same nine.
#include <uriparser/Uri.h>

#include <cstdlib>
#include <string>
#include <vector>

#include <Benchmarks/Measurements.h>
#include <Varnel/Identification/Links/TDSService.h>
#include <Varnel/Identification/User/Identificator.h>
#include <Varnel/Platform/Testing/FakeProcessInfo.h>
#include <Varnel/Platform/Testing/FakeUser.h>
#include <Varnel/Platform/Values/URLQuery.h>

namespace {

using namespace Varnel::Benchmarks;
using Varnel::Platform::URLQueryItem;

constexpr int rounds = 15;
constexpr int repetitions = 50'000;

class FixedIdentificator final : public Varnel::Identificator {
 public:
  std::string uniqueClientIdentifier() const override { return "1234567890.1456789012"; }
};

std::size_t composeWithPeer(const UriQueryListA& items) {
  char* query = nullptr;
  if (uriComposeQueryMallocExA(&query, &items, URI_FALSE, URI_FALSE) != URI_SUCCESS) std::abort();
  const std::size_t size = std::char_traits<char>::length(query);
  std::free(query);
  return size;
}

}  // namespace

int main() {
  Varnel::Platform::Testing::FakeProcessInfo process;
  Varnel::Platform::Testing::FakeUserLocale locale;
  locale.languageTags = {"en-US", "de-AT", "uk"};
  const auto configuration = std::make_shared<Varnel::TDSConfiguration>("Orvane 2 ä", "ov2");
  const Varnel::TDSService links({process, locale}, configuration,
                                 std::make_shared<FixedIdentificator>());

  const std::vector<URLQueryItem> items = links.defaultParams();
  std::vector<UriQueryListA> peerItems(items.size());
  for (std::size_t i = 0; i < items.size(); ++i)
    peerItems[i] = {items[i].name.c_str(), items[i].value ? items[i].value->c_str() : nullptr,
                    i + 1 < items.size() ? &peerItems[i + 1] : nullptr};
  const auto page = Varnel::Platform::URL::parse("https://shop.example/orvane?lang=en#prices");

  std::vector<Nanoseconds> ours, peers, copies, whole;
  const auto measure = [](std::vector<Nanoseconds>& samples, auto&& operation) {
    std::size_t size = 0;
    samples.push_back(timeOfOne(repetitions, [&] { size += operation(); }));
    if (size == 0) std::abort();
  };
  for (int round = 0; round < rounds; ++round) {
    measure(ours, [&] { return encodedURLQuery(items).size(); });
    measure(peers, [&] { return composeWithPeer(peerItems.front()); });
    measure(whole, [&] { return links.prepareUrl(*page)->absoluteString().size(); });
    const std::string query = encodedURLQuery(items);
    measure(copies, [&] { return std::string(query).size(); });
  }
  report("nine query items / uriparser", median(ours), median(peers), 0.4);
  report("nine query items / a copy of the result", median(ours), median(copies));
  report("a whole link, facts gathered / uriparser's items", median(whole), median(peers));
}
