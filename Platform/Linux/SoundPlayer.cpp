// SPDX-License-Identifier: MIT
#include <Platform/Ports/SoundPlayer.h>

#include <dlfcn.h>

#include <array>
#include <filesystem>
#include <utility>

#include <Platform/Linux/Adapters.h>
#include <Platform/Linux/GStreamer/Module.h>
#include <Platform/Ports/SystemLog.h>

namespace Varnel::Platform::Linux {
namespace {

namespace fs = std::filesystem;

constexpr const char* moduleName = "varnel/libvarnel-gstreamer.so";

// The folder of the file that this code was loaded from: the library, or the program that the
// library is a part of.
fs::path ownFolder() {
  Dl_info image{};
  if (::dladdr(reinterpret_cast<const void*>(&ownFolder), &image) == 0 || !image.dli_fname)
    return {};
  std::error_code failed;
  return fs::canonical(image.dli_fname, failed).parent_path();
}

void* openModule() {
  const fs::path folder = ownFolder();
  const std::array candidates = {
      folder / moduleName,
      folder.parent_path() / VARNEL_LIBRARY_FOLDER / moduleName,
  };
  for (const fs::path& candidate : candidates) {
    std::error_code failed;
    if (fs::exists(candidate, failed)) return ::dlopen(candidate.c_str(), RTLD_NOW | RTLD_LOCAL);
  }
  return nullptr;
}

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
    void* module = openModule();
    void* make = module ? ::dlsym(module, "varnelMakeSoundPlayer") : nullptr;
    if (make)
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
