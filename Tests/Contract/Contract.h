// SPDX-License-Identifier: MIT
#pragma once

#include <gtest/gtest.h>

#include <memory>
#include <string>
#include <type_traits>

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

template <typename World>
using Maker = std::unique_ptr<World> (*)();

/// Makes a column, as the world of the suite that it is of; of a fake alone, its column.
template <typename Column>
struct Make {
  template <typename World>
  operator Maker<World>() const {
    using Made =
        std::conditional_t<std::is_base_of_v<World, Column>, Column, FakeColumn<World, Column>>;
    return []() -> std::unique_ptr<World> { return std::make_unique<Made>(); };
  }
};

/// What a suite is instantiated with: this column, or this fake where there is nothing to arrange.
template <typename Column>
auto on() {
  return ::testing::Values(Make<Column>());
}

/// The suite of a port, which every column must pass. Each test has a world of its own.
///
///     class ClockWorld : public WorldOf<Clock> { … };                 // MainLoopWorlds.h
///     using ClockContract = Suite<ClockWorld>;
///     TEST_P(ClockContract, NeverStandsStill) { … world->port() … }   // MainLoopContracts.cpp
///     INSTANTIATE_TEST_SUITE_P(Fake, ClockContract, on<FakeClock>());
template <typename Type>
class Suite : public ::testing::TestWithParam<Maker<Type>> {
 protected:
  void SetUp() override {
    if (const std::string reason = world->obstacle(); !reason.empty()) GTEST_SKIP() << reason;
  }

  const std::unique_ptr<Type> world = this->GetParam()();
};

}  // namespace Varnel::Platform::Contract
