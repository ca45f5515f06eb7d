// SPDX-License-Identifier: MIT
#include <system_error>
#include <utility>
#include <vector>

#include <Varnel/Platform/Concurrency/StartThread.h>
#include <Varnel/Platform/Generic/DelivererConnection.h>
#include <Varnel/Platform/Linux/Adapters.h>
#include <Varnel/Platform/Linux/MainLoop/MainLoopBlock.h>
#include <Varnel/Platform/Linux/Notifications/BusNotificationServer.h>
#include <Varnel/Platform/Linux/Notifications/Module.h>
#include <Varnel/Platform/POSIX/Modules.h>

namespace Varnel::Platform::Linux {
namespace {

// The module's connection, which a thread loads with the first change or host; until then the last
// word of each kind waits. Where the module cannot be loaded, this process delivers itself. The
// main thread owns it; the thread knows it weakly.
class LoadedConnection final : public DelivererConnection,
                               public std::enable_shared_from_this<LoadedConnection> {
 public:
  LoadedConnection(std::string baseIdentifier, std::string store, MakeDeliverer makeDeliverer)
      : baseIdentifier_(std::move(baseIdentifier)),
        store_(std::move(store)),
        makeDeliverer_(std::move(makeDeliverer)) {}

  void setHost(std::weak_ptr<NotificationHost> host, Standing standing) override {
    host_ = host;
    standing_ = standing;
    hasHost_ = true;
    apply();
  }
  void setActive(bool isActive) override {
    isActive_ = isActive;
    if (connection_) connection_->setActive(isActive);
    if (isActive) apply();
  }
  void changed() override {
    isChanged_ = true;
    apply();
  }
  void changedAtOnce() override {
    isUrgent_ = true;
    apply();
  }
  void checkBanners(std::function<void(const Failure& obstacle)> answer) override {
    checks_.push_back(std::move(answer));
    apply();
  }
  bool isBusy() const override { return isLoading_ || (connection_ && connection_->isBusy()); }

 private:
  // Hands on what waits.
  void apply() {
    if (!connection_) return load();
    if (std::exchange(hasHost_, false)) connection_->setHost(host_, standing_);
    if (std::exchange(isChanged_, false)) connection_->changed();
    if (std::exchange(isUrgent_, false)) connection_->changedAtOnce();
    for (auto& check : std::exchange(checks_, {})) connection_->checkBanners(std::move(check));
  }

  void load() {
    if (std::exchange(isLoading_, true)) return;
    const auto load = [weak = weak_from_this()] {
      runOnMainLoop(
          [weak, loaded = POSIX::moduleFunction(sessionBusModule, "varnelMakeNotifierConnection")] {
            if (const auto self = weak.lock()) self->finish(loaded ? *loaded : nullptr);
          });
    };
    try {
      startThread("session-bus", load).detach();
    } catch (const std::system_error&) {
      load();
    }
  }

  void finish(void* function) {
    isLoading_ = false;
    connection_.reset(function ? reinterpret_cast<decltype(&varnelMakeNotifierConnection)>(
                                     function)(baseIdentifier_, store_, makeDeliverer_)
                               : makeDeliverer_().release());
    connection_->setActive(isActive_);
    apply();
  }

  const std::string baseIdentifier_;
  const std::string store_;
  const MakeDeliverer makeDeliverer_;
  std::unique_ptr<DelivererConnection> connection_;
  bool isLoading_ = false;
  bool isActive_ = false;
  // What waits.
  std::weak_ptr<NotificationHost> host_;
  Standing standing_ = Standing::application;
  bool hasHost_ = false;
  bool isChanged_ = false;
  bool isUrgent_ = false;
  std::vector<std::function<void(const Failure& obstacle)>> checks_;
};

}  // namespace

std::shared_ptr<DelivererConnection> makeNotifierConnection(std::string baseIdentifier,
                                                            std::string store,
                                                            MakeDeliverer makeDeliverer) {
  return std::make_shared<LoadedConnection>(std::move(baseIdentifier), std::move(store),
                                            std::move(makeDeliverer));
}

}  // namespace Varnel::Platform::Linux
