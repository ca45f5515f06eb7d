// SPDX-License-Identifier: MIT
#include <Platform/Concurrency/StartThread.h>

#include <gtest/gtest.h>
#include <pthread.h>
#include <signal.h>

#include <future>

#include <Basalt/Executor.h>
#include <Basalt/SerialQueue.h>

namespace Varnel::Platform {
namespace {

struct Facts {
  std::string name;
  bool takesSignals = false;
  bool takesFaults = false;
};

Facts currentFacts() {
  char name[16] = "";
  ::pthread_getname_np(::pthread_self(), name, sizeof name);
  sigset_t blocked;
  ::pthread_sigmask(SIG_BLOCK, nullptr, &blocked);
  Facts facts{.name = name};
  for (const int signal : {SIGTERM, SIGINT, SIGCHLD, SIGPIPE, SIGUSR1, SIGRTMIN})
    facts.takesSignals |= ::sigismember(&blocked, signal) == 0;
  facts.takesFaults = ::sigismember(&blocked, SIGSEGV) == 0;
  return facts;
}

using Start = void (*)(std::function<void()> body);

Facts factsIn(const Start& start) {
  std::promise<Facts> facts;
  start([&] { facts.set_value(currentFacts()); });
  return facts.get_future().get();
}

TEST(StartThread, LeavesTheSignalsOfTheProcessToTheHost) {
  const struct {
    const char* name;
    Start start;
  } cases[] = {
      {"a-name-of-more", [](auto body) { startThread("a-name-of-more", body).join(); }},
      {"cut-at-fifteen-", [](auto body) { startThread("cut-at-fifteen-bytes", body).join(); }},
      {"serial", [](auto body) { Basalt::SerialQueue("serial").async(body); }},
      {"concurrent", [](auto body) { Basalt::globalConcurrentQueue()->execute(body); }},
  };
  for (const auto& [name, start] : cases) {
    const Facts facts = factsIn(start);
    EXPECT_EQ(facts.name, name);
    EXPECT_FALSE(facts.takesSignals) << name;
    EXPECT_TRUE(facts.takesFaults) << name;
  }
  EXPECT_TRUE(currentFacts().takesSignals) << "the caller goes on as before";
}

}  // namespace
}  // namespace Varnel::Platform
