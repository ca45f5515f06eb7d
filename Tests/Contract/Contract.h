// SPDX-License-Identifier: MIT
#pragma once

#include <gtest/gtest.h>

#include <memory>
#include <string>

namespace Varnel::Platform::Contract {

/// What a suite runs on: a port of one system, and the means to arrange what the port finds there.
/// A suite says what it needs in a class of its own; each column implements that.
class World {
 public:
  World() = default;
  virtual ~World() = default;
  World(const World&) = delete;
  World& operator=(const World&) = delete;

  /// Why this machine cannot show it, or nothing. The test is skipped then.
  [[nodiscard]] virtual std::string obstacle() const { return {}; }
};

/// The suite of a port, which every column must pass. Each test has a world of its own.
///
///     class ClockWorld : public World { … };                               // ClockContract.h
///     using ClockContract = Suite<ClockWorld>;
///     TEST_P(ClockContract, NeverStandsStill) { … world->clock() … }       // ClockContract.cpp
///     INSTANTIATE_TEST_SUITE_P(Fake, ClockContract, ClockContract::on<FakeClock>());
template <typename Type>
class Suite : public ::testing::TestWithParam<std::unique_ptr<Type> (*)()> {
 public:
  using Maker = std::unique_ptr<Type> (*)();

  template <typename Column>
  static auto on() {
    return ::testing::Values(
        Maker([]() -> std::unique_ptr<Type> { return std::make_unique<Column>(); }));
  }

 protected:
  void SetUp() override {
    if (const std::string reason = world->obstacle(); !reason.empty()) GTEST_SKIP() << reason;
  }

  const std::unique_ptr<Type> world = this->GetParam()();
};

}  // namespace Varnel::Platform::Contract
