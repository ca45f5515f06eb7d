// SPDX-License-Identifier: MIT
#pragma once

#include <latch>
#include <thread>
#include <vector>

namespace Varnel::Tests {

/// Threads that start together and do the same work, each with its number from 0. They are waited
/// for at the end.
class Crew final {
 public:
  template <typename Work>
  Crew(unsigned count, Work work) : start_(count) {
    for (unsigned number = 0; number < count; ++number)
      threads_.emplace_back([this, work, number] {
        start_.arrive_and_wait();
        work(number);
      });
  }

  void join() { threads_.clear(); }

 private:
  std::latch start_;
  std::vector<std::jthread> threads_;
};

}  // namespace Varnel::Tests
