// SPDX-License-Identifier: MIT
#include <functional>
#include <system_error>
#include <utility>
#include <vector>

#include <Varnel/Platform/Concurrency/StartThread.h>
#include <Varnel/Platform/Linux/Adapters.h>
#include <Varnel/Platform/Linux/MainLoop/MainLoopBlock.h>
#include <Varnel/Platform/Linux/Notifications/BusNotificationServer.h>
#include <Varnel/Platform/Linux/Notifications/Module.h>
#include <Varnel/Platform/POSIX/Modules.h>
#include <Varnel/Platform/Ports/NotificationServer.h>
#include <Varnel/Platform/Ports/SystemLog.h>
#include <Varnel/Platform/Values/NotificationSource.h>

namespace Varnel::Platform::Linux {
namespace {

// The module's server, which a thread loads with the first request. Requests wait meanwhile; when
// the module cannot be loaded they fail, and the next one tries again. The main thread owns it; the
// thread knows it weakly.
class LoadedServer final : public std::enable_shared_from_this<LoadedServer> {
 public:
  using Observer = NotificationServer::Observer;
  using Loaded = Result<void*, POSIX::ModuleProblem>;

  struct Request {
    std::function<void(NotificationServer& server)> ask;
    std::function<void(const std::string& problem)> fail;
    std::string shownToken = {};
  };

  LoadedServer(SystemLog& systemLog, NotificationSource source, std::chrono::milliseconds patience)
      : systemLog_(systemLog), source_(std::move(source)), patience_(patience) {}

  void setObserver(std::weak_ptr<Observer> observer) {
    observer_ = std::move(observer);
    if (server_) server_->setObserver(observer_);
  }

  void setSource(const NotificationSource& source) {
    source_ = source;
    if (server_) server_->setSource(source_);
  }

  void request(Request request) {
    if (server_) return request.ask(*server_);
    waiting_.push_back(std::move(request));
    if (waiting_.size() == 1) load();
  }

  // A banner that is closed before it was shown needs no answer of its own.
  void forget(const std::string& token) {
    for (Request& request : waiting_)
      if (request.shownToken == token) request = {[](auto&) {}, [](auto&) {}};
  }

  void fail(const std::string& token) const {
    if (const auto told = observer_.lock()) told->bannerFailed(token);
  }

  [[nodiscard]] bool isBusy() const { return !waiting_.empty() || (server_ && server_->isBusy()); }

 private:
  void load() {
    const auto load = [weak = weak_from_this()] {
      runOnMainLoop(
          [weak, loaded = POSIX::moduleFunction(sessionBusModule, "varnelMakeNotificationServer")] {
            if (const auto self = weak.lock()) self->finish(loaded);
          });
    };
    try {
      startThread("session-bus", load).detach();
    } catch (const std::system_error&) {
      load();
    }
  }

  void finish(const Loaded& loaded) {
    std::string problem;
    if (loaded) {
      const auto make = reinterpret_cast<decltype(&varnelMakeNotificationServer)>(*loaded);
      server_.reset(make(systemLog_, source_, patience_));
      server_->setObserver(observer_);
    } else {
      problem = std::string("The module ") + sessionBusModule + " " + loaded.error().text + ".";
      if (problem != std::exchange(lastProblem_, problem))
        systemLog_.write("Cannot show a notification: " + problem);
    }
    for (const Request& request : std::exchange(waiting_, {}))
      server_ ? request.ask(*server_) : request.fail(problem);
  }

  SystemLog& systemLog_;
  NotificationSource source_;
  const std::chrono::milliseconds patience_;
  std::weak_ptr<Observer> observer_;
  std::unique_ptr<NotificationServer> server_;
  std::vector<Request> waiting_;
  std::string lastProblem_;
};

class ModuleNotificationServer final : public NotificationServer {
 public:
  ModuleNotificationServer(SystemLog& systemLog, const NotificationSource& source,
                           std::chrono::milliseconds patience)
      : server_(std::make_shared<LoadedServer>(systemLog, source, patience)) {}

  void setObserver(std::weak_ptr<Observer> observer) override {
    server_->setObserver(std::move(observer));
  }

  void setSource(const NotificationSource& source) override { server_->setSource(source); }

  void show(const std::string& token, const Banner& banner,
            const std::optional<std::string>& replacedReference) override {
    server_->request({.ask = [=](auto& server) { server.show(token, banner, replacedReference); },
                      .fail = failing(token),
                      .shownToken = token});
  }

  void close(const std::string& token, const std::optional<std::string>& reference) override {
    server_->forget(token);
    server_->request(
        {.ask = [=](auto& server) { server.close(token, reference); }, .fail = failing(token)});
  }

  void check(std::function<void(const std::optional<PlatformError>&)> answer) override {
    server_->request({.ask = [answer](auto& server) { server.check(answer); },
                      .fail =
                          [answer](const std::string& problem) {
                            answer(
                                PlatformError(notificationService, 0,
                                              {{std::string(localizedDescriptionKey), problem}}));
                          }});
  }

  bool isBusy() const override { return server_->isBusy(); }

 private:
  std::function<void(const std::string&)> failing(const std::string& token) const {
    return [weak = std::weak_ptr(server_), token](const std::string&) {
      if (const auto server = weak.lock()) server->fail(token);
    };
  }

  const std::shared_ptr<LoadedServer> server_;
};

}  // namespace

std::unique_ptr<NotificationServer> makeNotificationServer(SystemLog& systemLog,
                                                           const NotificationSource& source,
                                                           std::chrono::milliseconds patience) {
  return std::make_unique<ModuleNotificationServer>(systemLog, source, patience);
}

}  // namespace Varnel::Platform::Linux
