// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Ports/SoundPlayer.h>

#include <atomic>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <utility>

#include <Varnel/Platform/Generic/BackgroundSoundPlayer.h>
#include <Varnel/Platform/Linux/Adapters.h>
#include <Varnel/Platform/Linux/Sounds/GStreamer/Module.h>
#include <Varnel/Platform/POSIX/Modules.h>
#include <Varnel/Platform/Ports/SystemLog.h>

namespace Varnel::Platform::Linux {
namespace {

constexpr const char* module = "libvarnel-gstreamer.so";

// The outcome of loading the module, which the player's thread does. Reports a failure to the log
// once. Any thread.
class Loading final {
 public:
  explicit Loading(SystemLog& systemLog) : systemLog_(systemLog) {}

  std::unique_ptr<SoundOutput> load() {
    const auto make = POSIX::moduleFunction(module, "varnelMakeSoundOutput");
    // Never closed again: GStreamer cannot be unloaded.
    if (make)
      return std::unique_ptr<SoundOutput>(
          reinterpret_cast<decltype(&varnelMakeSoundOutput)>(*make)());
    const std::string problem = described(make.error().text);
    {
      const std::lock_guard lock(mutex_);
      failure_ = problem;
    }
    report(problem);
    return nullptr;
  }

  void report(const std::string& problem) {
    if (!hasReported_.exchange(true)) systemLog_.write("There will be no sounds: " + problem + ".");
  }

  std::optional<std::string> problem() const {
    // The module may be installed meanwhile.
    if (!POSIX::hasModule(module)) return described(POSIX::moduleIsMissing);
    const std::lock_guard lock(mutex_);
    return failure_;
  }

 private:
  static std::string described(const std::string& problem) {
    return std::string("the sound module, ") + module + ", " + problem;
  }

  SystemLog& systemLog_;
  std::atomic<bool> hasReported_ = false;
  mutable std::mutex mutex_;  // Owns failure_.
  std::optional<std::string> failure_;
};

// Plays with the module's output. Without the module nothing can be loaded.
class ModuleSoundPlayer final : public SoundPlayer {
 public:
  ModuleSoundPlayer(SystemLog& systemLog, MainQueue& mainQueue)
      : loading_(std::make_shared<Loading>(systemLog)),
        player_(mainQueue, [loading = loading_] { return loading->load(); }) {}

  std::shared_ptr<PlayableSound> load(std::string bytes) override {
    const auto missing = missingPart();
    if (!missing) return player_.load(std::move(bytes));
    loading_->report(*missing);
    return nullptr;
  }

  std::optional<std::string> missingPart() const override { return loading_->problem(); }

 private:
  const std::shared_ptr<Loading> loading_;
  BackgroundSoundPlayer player_;
};

}  // namespace

std::unique_ptr<SoundPlayer> makeSoundPlayer(SystemLog& systemLog, MainQueue& mainQueue) {
  return std::make_unique<ModuleSoundPlayer>(systemLog, mainQueue);
}

}  // namespace Varnel::Platform::Linux
