// SPDX-License-Identifier: MIT
#include <orvane-window/Model/Background.h>

#include <utility>

#include <Varnel/Platform/Concurrency/StartThread.h>
#include <Varnel/Platform/Ports/MainQueue.h>

namespace Orvane {

ThreadBackground::ThreadBackground(Varnel::Platform::MainQueue& mainQueue)
    : mainQueue_(mainQueue) {}

ThreadBackground::~ThreadBackground() {
  if (thread_.joinable()) thread_.join();
}

void ThreadBackground::start(Job job) {
  if (thread_.joinable()) thread_.join();
  const std::weak_ptr<bool> lifetime = lifetime_;
  thread_ = Varnel::Platform::startThread(
      "orvane-work", [&mainQueue = mainQueue_, lifetime, job = std::move(job)] {
        mainQueue.post([lifetime, goOn = job()] {
          if (!lifetime.expired()) goOn();
        });
      });
}

}  // namespace Orvane
