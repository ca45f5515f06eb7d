// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Ports/SoundPlayer.h>

#include <utility>

#include <Varnel/Platform/Generic/BackgroundSoundPlayer.h>
#include <Varnel/Platform/Linux/Adapters.h>
#include <Varnel/Platform/Linux/Sounds/GStreamer/Module.h>
#include <Varnel/Platform/POSIX/Modules.h>
#include <Varnel/Platform/Ports/SystemLog.h>

namespace Varnel::Platform::Linux {
namespace {

constexpr const char* module = "libvarnel-gstreamer.so";

// Plays by what is in the module. Without the module nothing can be loaded.
class ModuleSoundPlayer final : public SoundPlayer {
 public:
  ModuleSoundPlayer(SystemLog& systemLog, MainQueue& mainQueue)
      : systemLog_(systemLog), player_(mainQueue, [&systemLog] { return loadOutput(systemLog); }) {}

  std::shared_ptr<PlayableSound> load(std::string bytes) override {
    if (!missingPart()) return player_.load(std::move(bytes));
    if (!std::exchange(hasReported_, true))
      systemLog_.write("The sound module is missing; there will be no sounds.");
    return nullptr;
  }

  std::optional<std::string> missingPart() const override {
    if (POSIX::hasModule(module)) return std::nullopt;
    return std::string("the sound module, ") + module + ", was not built or is not installed";
  }

 private:
  static std::unique_ptr<SoundOutput> loadOutput(SystemLog& systemLog) {
    // Never closed again: GStreamer cannot be unloaded.
    if (void* make = POSIX::moduleFunction(module, "varnelMakeSoundOutput"))
      return std::unique_ptr<SoundOutput>(
          reinterpret_cast<decltype(&varnelMakeSoundOutput)>(make)());
    systemLog.write("The sound module does not load; there will be no sounds.");
    return nullptr;
  }

  SystemLog& systemLog_;
  bool hasReported_ = false;
  BackgroundSoundPlayer player_;
};

}  // namespace

std::unique_ptr<SoundPlayer> makeSoundPlayer(SystemLog& systemLog, MainQueue& mainQueue) {
  return std::make_unique<ModuleSoundPlayer>(systemLog, mainQueue);
}

}  // namespace Varnel::Platform::Linux
