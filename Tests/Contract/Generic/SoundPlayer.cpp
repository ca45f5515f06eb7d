// SPDX-License-Identifier: MIT
#include <Tests/Contract/MainLoopWorlds.h>
#include <Varnel/Platform/Generic/BackgroundSoundPlayer.h>
#include <Varnel/Platform/Testing/FakeMainQueue.h>

namespace Varnel::Platform::Contract {
namespace {

constexpr const char* whole = "fLaC";

// Each sound is over as soon as it has started, and says so twice.
struct ShortOutput final : SoundOutput {
  std::unique_ptr<Playback> start(const std::string& bytes, Ended ended) override {
    if (bytes != whole) return nullptr;
    for (const bool finished : {true, false}) ended(finished);
    return std::make_unique<Playback>();
  }
};

class BackgroundWorld final : public SoundPlayerWorld {
 public:
  SoundPlayer& port() override { return player_; }
  std::string sound() override { return whole; }
  std::string damagedSound() override { return sound() + "?"; }
  std::string noSound() override { return "no sound at all"; }
  void playUntil(const std::function<bool()>& condition) override {
    queue_.runWhile([&] { return !condition(); });
  }

 private:
  Testing::FakeMainQueue queue_;
  BackgroundSoundPlayer player_{queue_, [] { return std::make_unique<ShortOutput>(); }};
};
INSTANTIATE_TEST_SUITE_P(Background, SoundPlayerContract, on<BackgroundWorld>());

}  // namespace
}  // namespace Varnel::Platform::Contract
