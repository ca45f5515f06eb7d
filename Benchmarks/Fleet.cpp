// SPDX-License-Identifier: MIT
// Fleet [INSTALLATIONS [PLOT]]: a day of that many installations (a million) that send their events
// to one server, in simulated time, under the delivery policy that ships. From noon on the server
// fails for an hour, in several ways. Prints how many requests its busiest minute had to bear, and
// draws them into a file. Exits with 1 when the hour after the failure was too uneven, or an event
// was lost.
#include <algorithm>
#include <cmath>
#include <cstdlib>
#include <numbers>
#include <numeric>
#include <random>
#include <string>
#include <vector>

#include <Benchmarks/Drawing.h>
#include <Benchmarks/Measurements.h>
#include <Varnel/Tallyhouse/DeliveryPolicy.h>
#include <Varnel/Tallyhouse/EventRecorder.h>

namespace {

using namespace Tallyhouse;
using namespace Varnel::Benchmarks;
using namespace std::chrono_literals;
using std::chrono::seconds;
using Varnel::Platform::Date;

constexpr int eventsADay = 20;
constexpr Date midnight{};
constexpr Date failing = midnight + 12h, mended = failing + 1h;
constexpr Date end = midnight + 48h;  // New events come on the first day alone.
constexpr double maxUnevenness = 3;

using Random = std::mt19937_64;

double share(Random& random) {
  return std::uniform_real_distribution<>()(random);
}

struct Answer {
  std::optional<int> status;
  std::optional<seconds> retryAfter = std::nullopt;
};

// What the server answers while it fails.
struct Server {
  const char* name;
  Answer (*answer)(Date now, Random& random);
};

constexpr Answer done{200};
constexpr Server servers[] = {
    {"a usual day", [](Date, Random&) { return done; }},
    {"an hour without an answer", [](Date, Random&) { return Answer{}; }},
    {"503, try again in ten minutes",
     [](Date, Random&) {
       return Answer{503, 10min};
     }},
    {"503, try again when it is over",
     [](Date now, Random&) {
       return Answer{503, std::chrono::ceil<seconds>(mended - now)};
     }},
    {"503 to every second request",
     [](Date, Random& random) { return share(random) < 0.5 ? Answer{503} : done; }},
};

struct Fleet {
  std::vector<int> load = std::vector<int>((end - midnight) / 1min);  ///< Requests of each minute.
  std::size_t maxWaiting = 0;                                         ///< In one installation.
  long undelivered = 0;
};

// More in the afternoon than in the night.
std::vector<Date> eventsOfADay(Random& random) {
  std::vector<Date> dates;
  while (dates.size() < eventsADay) {
    const double day = share(random);
    if (share(random) * 2 < 1 - 0.8 * std::cos(2 * std::numbers::pi * (day - 2.0 / 24)))
      dates.push_back(midnight + std::chrono::duration_cast<Date::duration>(day * 24h));
  }
  std::sort(dates.begin(), dates.end());
  return dates;
}

// An installation that runs all day and is never offline: whoever is not there cannot be in the
// way.
void live(const Server& server, const DeliveryPolicy& policy, Random& random, Fleet& fleet) {
  const std::vector<Date> events = eventsOfADay(random);
  std::size_t recorded = 0, delivered = 0;
  std::optional<Date> notBefore;
  int failures = 0;
  for (Date now = midnight;;) {
    const std::size_t waiting = recorded - delivered;
    fleet.maxWaiting = std::max(fleet.maxWaiting, waiting);
    Backlog backlog;
    backlog.waiting = static_cast<std::int64_t>(std::min(waiting, policy.maxBatchEvents));
    if (waiting > 0) backlog.oldest = events[delivered];
    const auto sending = policy.nextSending(backlog, notBefore, now);
    if (recorded < events.size() && events[recorded] <= sending.value_or(end)) {
      now = events[recorded++];
      continue;
    }
    if (!sending || *sending >= end) break;
    now = *sending;
    ++fleet.load[static_cast<std::size_t>((now - midnight) / 1min)];
    const Answer answer = now >= failing && now < mended ? server.answer(now, random) : done;
    if (DeliveryPolicy::verdict(answer.status) == Verdict::delivered) {
      delivered += static_cast<std::size_t>(backlog.waiting);
      notBefore.reset();
      failures = 0;
    } else {
      notBefore =
          now + policy.retryDelay(++failures, Obstacle::server, answer.retryAfter, share(random));
    }
  }
  fleet.undelivered += static_cast<long>(events.size() - delivered);
}

struct Hour {
  int busiest;
  double mean;
};

Hour hourFrom(const Fleet& fleet, Date start) {
  const auto first = fleet.load.begin() + (start - midnight) / 1min;
  long sum = 0;
  for (auto minute = first; minute != first + 60; ++minute) sum += *minute;
  return {*std::max_element(first, first + 60), static_cast<double>(sum) / 60};
}

// A picture for each server, one below the other, from an hour before the failure on.
void plot(const std::vector<Fleet>& fleets, const char* file) {
  constexpr int width = 720, height = 90, gap = 34, left = 60, hours = 7;
  constexpr int first = (failing - 1h - midnight) / 1min;
  int max = 1;
  for (const Fleet& fleet : fleets)
    max = std::max(max, *std::max_element(fleet.load.begin(), fleet.load.end()));
  Drawing drawing(width + left + 20, static_cast<int>(fleets.size()) * (height + gap) + 30);
  const auto x = [&](int minute) { return left + width * (minute - first) / (hours * 60.0); };
  int top = gap;
  for (std::size_t i = 0; i < fleets.size(); ++i, top += height + gap) {
    const int bottom = top + height;
    drawing.area({x(first + 60), 1.0 * top}, x(first + 120) - x(first + 60), height, "#f3dede");
    drawing.text({left, top - 6.0}, servers[i].name);
    drawing.text({left - 6, top + 10.0}, std::to_string(max), Drawing::Anchor::end);
    drawing.line({{left, 1.0 * top}, {left, 1.0 * bottom}, {left + width, 1.0 * bottom}},
                 Drawing::axis);
    std::vector<Drawing::Point> points;
    for (int minute = first; minute < first + hours * 60; ++minute)
      points.push_back(
          {x(minute),
           bottom - 1.0 * height * fleets[i].load[static_cast<std::size_t>(minute)] / max});
    drawing.line(points, Drawing::curve);
  }
  for (int hour = 0; hour <= hours; ++hour)
    drawing.text({x(first + hour * 60), top - gap + 16.0}, fmt::format("{}:00", first / 60 + hour),
                 Drawing::Anchor::middle);
  drawing.write(file);
}

}  // namespace

int main(int count, char** arguments) {
  const long installations = count > 1 ? std::atol(arguments[1]) : 1'000'000;
  const DeliveryPolicy policy;
  const auto maxWaiting = static_cast<std::size_t>(SpoolLimits().maxEvents);
  bool isGood = true;
  std::vector<Fleet> fleets;
  for (const Server& server : servers) {
    Random random(1);
    Fleet& fleet = fleets.emplace_back();
    for (long i = 0; i < installations; ++i) live(server, policy, random, fleet);
    const Hour during = hourFrom(fleet, failing), after = hourFrom(fleet, mended);
    report(fmt::format("{}: busiest minute / mean, 12 to 13", server.name), during.busiest,
           during.mean, std::nullopt, "");
    report(fmt::format("{}: busiest minute / mean, 13 to 14", server.name), after.busiest,
           after.mean, maxUnevenness, "");
    const long requests = std::accumulate(fleet.load.begin(), fleet.load.end(), 0L);
    fmt::print("  {:.1f} million requests, at most {} events wait, {} are lost\n",
               static_cast<double>(requests) / 1e6, fleet.maxWaiting, fleet.undelivered);
    isGood = isGood && after.busiest <= maxUnevenness * after.mean && fleet.undelivered == 0 &&
             fleet.maxWaiting <= maxWaiting;
  }
  if (count > 2) plot(fleets, arguments[2]);
  return isGood ? EXIT_SUCCESS : EXIT_FAILURE;
}
