// SPDX-License-Identifier: MIT
#include <Varnel/Tallyhouse/MeasurementProtocol.h>

#include <algorithm>

#include <Varnel/Platform/Values/PercentEncoding.h>
#include <fmt/format.h>

namespace Tallyhouse {
namespace {

constexpr std::size_t usualHit = 512;
constexpr auto unreserved = Varnel::Platform::alphanumericAnd("-._~");

void append(std::string& hit, std::string_view name, std::string_view value) {
  ((hit += '&') += name) += '=';
  Varnel::Platform::appendPercentEncoded(hit, value, unreserved);
}

}  // namespace

std::string encodedHit(const AnalyticsEvent& event, const AnalyticsIdentity& identity) {
  std::string hit;
  hit.reserve(usualHit);
  hit += "v=1&t=event";
  append(hit, "tid", identity.trackingID);
  append(hit, "cid", identity.clientID);
  append(hit, "ec", event.category);
  append(hit, "ea", event.action);
  if (event.label) append(hit, "el", *event.label);
  if (event.value) append(hit, "ev", std::to_string(*event.value));
  for (std::size_t i = 0; i < event.customDimensions.size(); ++i)
    if (const auto& dimension = event.customDimensions[i])
      append(hit, "cd" + std::to_string(i + 1), *dimension);
  for (std::size_t i = 0; i < event.customMetrics.size(); ++i)
    if (const auto& metric = event.customMetrics[i])
      append(hit, "cm" + std::to_string(i + 1), std::to_string(*metric));
  if (event.isTest) append(hit, "ds", "test");
  return hit;
}

void appendToBatch(std::string& batch, std::string_view hit, std::chrono::milliseconds age,
                   std::string_view uuid) {
  if (!batch.empty()) batch += '\n';
  fmt::format_to(std::back_inserter(batch), "{}&qt={}&z={}", hit,
                 std::max(age, std::chrono::milliseconds(0)).count(), uuid);
}

}  // namespace Tallyhouse
