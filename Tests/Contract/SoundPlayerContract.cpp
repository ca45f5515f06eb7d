// SPDX-License-Identifier: MIT
#include <Tests/Contract/MainLoopWorlds.h>

#include <gmock/gmock.h>

#include <utility>
#include <vector>

#include <Varnel/Platform/Testing/FakeSoundPlayer.h>

namespace Varnel::Platform::Contract {
namespace {

using ::testing::ElementsAre;

struct Listener final : SoundDelegate {
  std::vector<std::pair<PlayableSound*, bool>> ends;
  bool playsAgain = false;

  void sound(PlayableSound& sound, bool finished) override {
    EXPECT_FALSE(sound.isPlaying());
    ends.emplace_back(&sound, finished);
    if (std::exchange(playsAgain, false)) sound.play();
  }
};

TEST_P(SoundPlayerContract, RefusesWhatDoesNotBeginLikeASound) {
  EXPECT_EQ(world->port().load(""), nullptr);
  EXPECT_EQ(world->port().load(world->noSound()), nullptr);
  EXPECT_EQ(world->port().missingPart(), std::nullopt);
}

TEST_P(SoundPlayerContract, EachPlayEndsOnceAndLater) {
  const auto listener = std::make_shared<Listener>();
  const auto sound = world->port().load(world->sound());
  EXPECT_FALSE(sound->isPlaying());
  sound->setDelegate(listener);
  sound->play();
  sound->play();
  EXPECT_TRUE(sound->isPlaying());
  EXPECT_TRUE(listener->ends.empty());
  listener->playsAgain = true;
  world->playUntil([&] { return listener->ends.size() == 2; });
  EXPECT_FALSE(sound->isPlaying());
  EXPECT_THAT(listener->ends,
              ElementsAre(std::pair(sound.get(), true), std::pair(sound.get(), true)));
}

TEST_P(SoundPlayerContract, NothingIsHeardOfASoundThatWasStoppedOrDropped) {
  const auto listener = std::make_shared<Listener>();
  const auto load = [&] {
    auto sound = world->port().load(world->sound());
    sound->setDelegate(listener);
    sound->play();
    return sound;
  };
  const auto stopped = load();
  auto dropped = load();
  const auto last = load();
  stopped->stop();
  EXPECT_FALSE(stopped->isPlaying());
  stopped->stop();
  dropped.reset();
  world->playUntil([&] { return !last->isPlaying(); });
  EXPECT_THAT(listener->ends, ElementsAre(std::pair(last.get(), true)));
  stopped->play();
  world->playUntil([&] { return listener->ends.size() == 2; });
}

TEST_P(SoundPlayerContract, ADamagedSoundEndsUnfinished) {
  const auto listener = std::make_shared<Listener>();
  const auto sound = world->port().load(world->damagedSound());
  ASSERT_NE(sound, nullptr);
  sound->setDelegate(listener);
  sound->play();
  EXPECT_TRUE(sound->isPlaying());
  world->playUntil([&] { return !sound->isPlaying(); });
  EXPECT_THAT(listener->ends, ElementsAre(std::pair(sound.get(), false)));
}

TEST_P(SoundPlayerContract, TheDelegateOfTheEndIsToldIfItIsStillThere) {
  const auto listener = std::make_shared<Listener>();
  auto gone = std::make_shared<Listener>();
  const auto sound = world->port().load(world->sound());
  sound->setDelegate(gone);
  sound->play();
  sound->setDelegate(listener);
  world->playUntil([&] { return !sound->isPlaying(); });
  EXPECT_EQ(listener->ends.size(), 1u);
  EXPECT_TRUE(gone->ends.empty());
  sound->setDelegate(gone);
  sound->play();
  gone.reset();
  world->playUntil([&] { return !sound->isPlaying(); });
  EXPECT_EQ(listener->ends.size(), 1u);
}

class FakeSoundPlayerWorld final : public FakeColumn<SoundPlayerWorld, Testing::FakeSoundPlayer> {
 public:
  std::string sound() override { return "sound"; }
  std::string damagedSound() override { return "damaged"; }
  std::string noSound() override { return "broken"; }
  void playUntil(const std::function<bool()>& condition) override {
    while (!condition())
      for (const auto& sound : port_.sounds) sound->end(sound->bytes != damagedSound());
  }
};
INSTANTIATE_TEST_SUITE_P(Fake, SoundPlayerContract, on<FakeSoundPlayerWorld>());

}  // namespace
}  // namespace Varnel::Platform::Contract
