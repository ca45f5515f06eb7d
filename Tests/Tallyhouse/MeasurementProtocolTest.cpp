// SPDX-License-Identifier: MIT
#include <Varnel/Tallyhouse/MeasurementProtocol.h>

#include <gtest/gtest.h>

namespace Tallyhouse {
namespace {

TEST(MeasurementProtocol, AHitIsOneLineWhateverTheTexts) {
  const AnalyticsEvent event{.uuid = "U",
                             .date = {},
                             .category = "Scan & more=1",
                             .action = "line\nbreak",
                             .label = "\xC3\xA4+",
                             .value = -7,
                             .customDimensions = {"12.34", std::nullopt, "", "4"},
                             .customMetrics = {std::nullopt, 9},
                             .isTest = true};
  std::string batch;
  appendToBatch(batch, encodedHit(event, {"QN-1", "12.34"}), std::chrono::seconds(3), "U");
  EXPECT_EQ(batch,
            "v=1&t=event&tid=QN-1&cid=12.34&ec=Scan%20%26%20more%3D1&ea=line%0Abreak&el=%C3%A4%2B"
            "&ev=-7&cd1=12.34&cd3=&cd4=4&cm2=9&ds=test&qt=3000&z=U");
  AnalyticsEvent bare{};
  bare.category = "c";
  bare.action = "a";
  appendToBatch(batch, encodedHit(bare, {"t", "i"}), std::chrono::seconds(-3), "V");
  EXPECT_TRUE(batch.ends_with("&z=U\nv=1&t=event&tid=t&cid=i&ec=c&ea=a&qt=0&z=V"));
}

}  // namespace
}  // namespace Tallyhouse
