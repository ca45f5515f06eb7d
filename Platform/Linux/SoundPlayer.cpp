// SPDX-License-Identifier: MIT
#include <Platform/Ports/SoundPlayer.h>

#include <utility>

#include <Platform/Linux/Adapters.h>
#include <Platform/Linux/GStreamer/Module.h>
#include <Platform/POSIX/Modules.h>
#include <Platform/Ports/SystemLog.h>

namespace Varnel::Platform::Linux {
namespace {

// Hands everything to the player of the module. Without the module nothing can be loaded.
class ModuleSoundPlayer final : public SoundPlayer {
 public:
  explicit ModuleSoundPlayer(SystemLog& systemLog) : systemLog_(systemLog) {}

  std::shared_ptr<PlayableSound> load(std::string bytes) override {
    if (!std::exchange(hasLooked_, true)) loadPlayer();
    return player_ ? player_->load(std::move(bytes)) : nullptr;
  }

 private:
  void loadPlayer() {
    // Never closed again: GStreamer cannot be unloaded.
    if (void* make = POSIX::moduleFunction("libvarnel-gstreamer.so", "varnelMakeSoundPlayer"))
      player_.reset(reinterpret_cast<decltype(&varnelMakeSoundPlayer)>(make)());
    else
      systemLog_.write("The sound module is missing; there will be no sounds.");
  }

  SystemLog& systemLog_;
  bool hasLooked_ = false;
  std::unique_ptr<SoundPlayer> player_;
};

}  // namespace

std::unique_ptr<SoundPlayer> makeSoundPlayer(SystemLog& systemLog) {
  return std::make_unique<ModuleSoundPlayer>(systemLog);
}

}  // namespace Varnel::Platform::Linux
