// SPDX-License-Identifier: MIT
// The time to compose a link's nine query items, beside uriparser's time for the same nine.
#include <uriparser/Uri.h>

#include <algorithm>
#include <chrono>
#include <cstdlib>
#include <functional>
#include <vector>

#include <Varnel/Identification/Links/TDSService.h>
#include <Varnel/Identification/User/Identificator.h>
#include <Varnel/Platform/Testing/FakeProcessInfo.h>
#include <Varnel/Platform/Testing/FakeUser.h>
#include <Varnel/Platform/Values/URLQuery.h>
#include <fmt/format.h>

namespace {

using Varnel::Platform::URLQueryItem;

constexpr int rounds = 15;
constexpr int repetitions = 50'000;

class FixedIdentificator final : public Varnel::Identificator {
 public:
  std::string uniqueClientIdentifier() const override { return "1234567890.1456789012"; }
};

// Nanoseconds a call.
double timeOf(const std::function<std::size_t()>& operation) {
  using Clock = std::chrono::steady_clock;
  std::size_t size = 0;
  const auto start = Clock::now();
  for (int i = 0; i < repetitions; ++i) size += operation();
  const std::chrono::duration<double, std::nano> taken = Clock::now() - start;
  if (size == 0) std::abort();
  return taken.count() / repetitions;
}

double median(std::vector<double> values) {
  std::nth_element(values.begin(), values.begin() + rounds / 2, values.end());
  return values[rounds / 2];
}

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

  std::vector<double> ours, peers, copies, whole;
  for (int round = 0; round < rounds; ++round) {
    ours.push_back(timeOf([&] { return encodedURLQuery(items).size(); }));
    peers.push_back(timeOf([&] { return composeWithPeer(peerItems.front()); }));
    whole.push_back(timeOf([&] { return links.prepareUrl(*page)->absoluteString().size(); }));
    const std::string query = encodedURLQuery(items);
    copies.push_back(timeOf([&] { return std::string(query).size(); }));
  }
  fmt::print("{:40}{:8.0f} ns\n", "nine items, encodedURLQuery", median(ours));
  fmt::print("{:40}{:8.0f} ns\n", "nine items, uriparser", median(peers));
  fmt::print("{:40}{:8.0f} ns\n", "a copy of the result", median(copies));
  fmt::print("{:40}{:8.0f} ns\n", "a whole link, facts gathered", median(whole));
  fmt::print("{:40}{:8.2f}     (goal 0.55)\n", "encodedURLQuery to uriparser",
             median(ours) / median(peers));
}
