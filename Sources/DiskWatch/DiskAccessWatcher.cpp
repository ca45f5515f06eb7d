// SPDX-License-Identifier: MIT
#include <Varnel/DiskWatch/DiskAccessWatcher.h>

#include <chrono>
#include <system_error>
#include <utility>

#include <Varnel/DiskAccess/DiskAccessManager.h>
#include <Varnel/Logging/Logger.h>
#include <Varnel/Platform/Concurrency/StartThread.h>
#include <Varnel/Platform/Ports/Ports.h>

namespace Varnel {
namespace {

constexpr std::chrono::milliseconds timeBetweenLooks{500};

}  // namespace

DiskAccessWatcher::DiskAccessWatcher(std::string program)
    : DiskAccessWatcher({.manager = DiskAccessManager::shared(),
                         .board = Platform::processPorts().sessionBoard,
                         .logger = Logger::instance()},
                        std::move(program)) {}

DiskAccessWatcher::DiskAccessWatcher(DiskAccessWatch::Ports ports, std::string program)
    : watch_(ports, std::move(program)) {
  try {
    thread_ = Platform::startThread("disk-watch", [this] { run(); });
  } catch (const std::system_error&) {
    // The program reads as well without.
  }
}

DiskAccessWatcher::~DiskAccessWatcher() {
  {
    const std::lock_guard lock(mutex_);
    isOver_ = true;
  }
  changed_.notify_one();
  if (thread_.joinable()) thread_.join();
}

void DiskAccessWatcher::run() {
  std::unique_lock lock(mutex_);
  do {
    lock.unlock();
    watch_.look(std::chrono::steady_clock::now());
    lock.lock();
  } while (!changed_.wait_for(lock, timeBetweenLooks, [this] { return isOver_; }));
}

}  // namespace Varnel
