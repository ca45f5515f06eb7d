// SPDX-License-Identifier: MIT
#include <Varnel/Interface/SoundEngine.h>

#include <gtest/gtest.h>

#include <functional>

#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Context/Bundle.h>
#include <Varnel/Platform/Testing/FakeSoundPlayer.h>

namespace Varnel {
namespace {

// An engine over a bundle in which Purchase.aiff is missing and RankIncreased.m4a is damaged.
class SoundEngineTest : public ::testing::Test {
 protected:
  SoundEngineTest() {
    for (const Sound sound : Sound::allValues())
      if (sound != Sound::purchase) folder.write(sound.fileName(), sound.fileName());
    folder.write("RankIncreased.m4a", "broken");
  }

  Platform::Testing::FakeSound& lastSound() { return *player.sounds.back(); }

  const Tests::TemporaryFolder folder;
  const Bundle bundle{folder.path().string(), {}};
  Platform::Testing::FakeSoundPlayer player;
  SoundEngine engine{
      {.player = player, .path = [this](Sound sound) { return sound.path(bundle); }}};
};

TEST(Sound, HasPublishedValuesAndFiles) {
  std::string names;
  for (int value = -1; value <= 7; ++value) {
    const auto sound = Sound::withRawValue(value);
    names += sound ? sound->fileName() + " " : "- ";
  }
  EXPECT_EQ(names,
            "- Tutorial.m4a Start.m4a ScanComplete.m4a CleanComplete.m4a "
            "AchievementNotification.m4a RankIncreased.m4a Purchase.aiff - ");
  EXPECT_EQ(Sound::achievementNotification.rawValue(), 4);
  EXPECT_EQ(std::hash<Sound>()(Sound::purchase), 6u);
}

TEST_F(SoundEngineTest, ANewSoundCutsOffTheOneBefore) {
  engine.play(Sound::start);
  Platform::Testing::FakeSound& first = lastSound();
  EXPECT_EQ(engine.currentSound().get(), &first);
  EXPECT_EQ(first.bytes, "Start.m4a");
  EXPECT_TRUE(first.isPlaying());

  engine.play(Sound::tutorial);
  EXPECT_EQ(first.timesStopped, 1);
  EXPECT_EQ(engine.currentSound().get(), &lastSound());
  EXPECT_EQ(lastSound().bytes, "Tutorial.m4a");
  first.end();
  EXPECT_TRUE(engine.currentSound()) << "the end of a sound that was cut off means nothing";
}

TEST_F(SoundEngineTest, IsIdleAfterTheEndOrAStop) {
  const std::function<void()> ends[] = {[&] { lastSound().end(true); },
                                        [&] { lastSound().end(false); }, [&] { engine.stop(); }};
  for (const auto& end : ends) {
    engine.play(Sound::start);
    end();
    EXPECT_FALSE(engine.currentSound());
    EXPECT_EQ(lastSound().timesStopped, &end == &ends[2] ? 1 : 0);
  }
  engine.stop();
}

TEST_F(SoundEngineTest, ASoundThatCannotBeLoadedStillEndsTheOneBeforeAndNoLaterOne) {
  for (const Sound unplayable : {Sound::purchase, Sound::rankIncreased}) {
    engine.play(Sound::start);
    engine.play(unplayable);
    EXPECT_FALSE(engine.currentSound());
    EXPECT_FALSE(lastSound().isPlaying());
  }
  engine.play(Sound::tutorial);
  EXPECT_TRUE(engine.currentSound() && lastSound().isPlaying());
  EXPECT_EQ(player.sounds.size(), 3u);
}

TEST_F(SoundEngineTest, MutingLeavesWhatPlaysAlone) {
  engine.play(Sound::start);
  engine.setSoundsEnabled(false);
  engine.play(Sound::tutorial);
  engine.play(Sound::purchase);
  EXPECT_EQ(player.sounds.size(), 1u);
  EXPECT_EQ(engine.currentSound().get(), &lastSound());
  EXPECT_TRUE(lastSound().isPlaying());
}

TEST_F(SoundEngineTest, AnySoundsEndStopsTheCurrentOne) {
  engine.play(Sound::start);
  const auto first = engine.currentSound();
  const auto other = player.load("of the host");
  engine.setCurrentSound(other);
  lastSound().play();
  player.sounds.front()->end();
  EXPECT_FALSE(engine.currentSound());
  EXPECT_EQ(lastSound().timesStopped, 1);
}

TEST_F(SoundEngineTest, ASoundMayOutliveItsEngine) {
  auto brief = std::make_unique<SoundEngine>(SoundEngine::Ports{
      .player = player, .path = [this](Sound sound) { return sound.path(bundle); }});
  brief->play(Sound::start);
  const auto sound = brief->currentSound();
  brief->setCurrentSound(nullptr);
  brief.reset();
  lastSound().end();
}

}  // namespace
}  // namespace Varnel
