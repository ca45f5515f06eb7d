// SPDX-License-Identifier: MIT
#pragma once

#include <gtest/gtest.h>

#include <memory>
#include <string>

namespace Varnel::Platform::Contract {

/// What a suite runs on: the means to arrange what a port of one system finds there. A suite says
/// what it needs in a class of its own; each column implements that.
class World {
 public:
  World() = default;
  virtual ~World() = default;
  World(const World&) = delete;
  World& operator=(const World&) = delete;

  /// Why this machine cannot show it, or nothing. The test is skipped then.
  [[nodiscard]] virtual std::string obstacle() const { return {}; }
};

/// The world of a suite that judges one object.
template <typename Type>
class WorldOf : public World {
 public:
  using Port = Type;
  virtual Port& port() = 0;
};

/// A column whose port is this fake, or what this function makes; all else it has to arrange.
template <typename World, typename Fake>
class FakeColumn : public World {
 public:
  typename World::Port& port() override { return port_; }

 protected:
  Fake port_;
};
template <typename World, auto make>
class AdapterColumn : public World {
 public:
  typename World::Port& port() override { return *port_; }

 protected:
  const std::unique_ptr<typename World::Port> port_ = make();
};

/// The suite of a port, which every column must pass. Each test has a world of its own.
///
///     class ClockWorld : public WorldOf<Clock> { … };                      // MainLoopWorlds.h
///     using ClockContract = Suite<ClockWorld>;
///     TEST_P(ClockContract, NeverStandsStill) { … world->port() … }        //
///     MainLoopContracts.cpp INSTANTIATE_TEST_SUITE_P(Fake, ClockContract,
///     ClockContract::on<FakeClock>());
template <typename Type>
class Suite : public ::testing::TestWithParam<std::unique_ptr<Type> (*)()> {
 public:
  using Maker = std::unique_ptr<Type> (*)();

  template <typename Column>
  static auto on() {
    return ::testing::Values(
        Maker([]() -> std::unique_ptr<Type> { return std::make_unique<Column>(); }));
  }
  template <typename Fake>
  static auto onFake() {
    return on<FakeColumn<Type, Fake>>();
  }
  template <auto make>
  static auto onAdapter() {
    return on<AdapterColumn<Type, make>>();
  }

 protected:
  void SetUp() override {
    if (const std::string reason = world->obstacle(); !reason.empty()) GTEST_SKIP() << reason;
  }

  const std::unique_ptr<Type> world = this->GetParam()();
};

}  // namespace Varnel::Platform::Contract
