// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Generic/BackgroundSoundPlayer.h>

#include <gmock/gmock.h>
#include <sys/syscall.h>

#include <atomic>
#include <semaphore>
#include <vector>

#include <Tests/Support/ForbiddenCalls.h>
#include <Varnel/Platform/Generic/SoundKind.h>
#include <Varnel/Platform/Testing/FakeMainQueue.h>

namespace Varnel::Platform {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;

const std::string file = "fLaC";

// An output whose sounds end when the test says so, and of which each start lasts until the test
// lets it through.
struct Machine {
  struct Sounding final : SoundOutput::Playback {
    explicit Sounding(Machine& owner) : machine(owner) {}
    ~Sounding() override { ++machine.silenced; }
    Machine& machine;
  };
  struct Output final : SoundOutput {
    explicit Output(Machine& owner) : machine(owner) {}
    std::unique_ptr<Playback> start(const std::string& bytes, Ended ended) override {
      machine.mayStart.acquire();
      machine.ends.push_back(ended);
      machine.started.release();
      return bytes == file ? std::make_unique<Sounding>(machine) : nullptr;
    }
    Machine& machine;
  };

  std::counting_semaphore<> mayStart{0};
  std::counting_semaphore<> started{0};
  // To be looked at between a start and the next.
  std::vector<SoundOutput::Ended> ends;
  std::atomic<int> silenced = 0;
};

class Listener final : public SoundDelegate {
 public:
  std::vector<bool> ends;
  void sound(PlayableSound&, bool finished) override { ends.push_back(finished); }
};

class BackgroundSoundPlayerTest : public ::testing::Test {
 protected:
  std::shared_ptr<PlayableSound> load(const std::string& bytes = file) {
    auto sound = player->load(bytes);
    sound->setDelegate(listener);
    return sound;
  }

  Machine machine;
  Testing::FakeMainQueue queue;
  const std::shared_ptr<Listener> listener = std::make_shared<Listener>();
  std::unique_ptr<BackgroundSoundPlayer> player = std::make_unique<BackgroundSoundPlayer>(
      queue, [this] { return std::make_unique<Machine::Output>(machine); });
};

TEST_F(BackgroundSoundPlayerTest, AStopBeforeTheStartCancelsIt) {
  const auto first = load();
  const auto second = load();
  auto dropped = load();
  first->play();
  // Waits behind the first, which has not started yet.
  second->play();
  EXPECT_TRUE(second->isPlaying());
  second->stop();
  EXPECT_FALSE(second->isPlaying());
  dropped->play();
  dropped.reset();
  machine.mayStart.release(3);
  machine.started.acquire();
  first->stop();
  player.reset();
  queue.drain();
  EXPECT_EQ(machine.ends.size(), 1u);
  EXPECT_THAT(listener->ends, IsEmpty());
}

TEST_F(BackgroundSoundPlayerTest, AStoppedSoundIsSilentAndNeverReports) {
  auto sound = load();
  for (const bool isDropped : {false, true}) {
    sound->play();
    machine.mayStart.release();
    machine.started.acquire();
    // The end is on its way to the main queue.
    machine.ends.back()(true);
    isDropped ? sound.reset() : sound->stop();
    queue.drain();
  }
  player.reset();
  EXPECT_EQ(machine.silenced, 2);
  EXPECT_THAT(listener->ends, IsEmpty());
}

TEST_F(BackgroundSoundPlayerTest, WhatCannotBePlayedEndsOnTheMainQueue) {
  BackgroundSoundPlayer mute(queue, [] { return nullptr; });
  const auto unheard = mute.load(file);
  unheard->setDelegate(listener);
  BackgroundSoundPlayer another(queue, [] { return nullptr; });
  const auto threadless = another.load(file);
  threadless->setDelegate(listener);
  const auto expectFailure = [&](PlayableSound& sound) {
    listener->ends.clear();
    sound.play();
    queue.runWhile([&] { return sound.isPlaying(); });
    EXPECT_THAT(listener->ends, ElementsAre(false));
  };
  expectFailure(*unheard);
  Tests::onAKernelThatForbids({SYS_clone, SYS_clone3}, EAGAIN, [&] { expectFailure(*threadless); });
}

TEST(SoundKind, IsToldByTheFirstBytes) {
  using namespace std::string_view_literals;
  for (const auto bytes : {"\0\0\0\x1c"
                           "ftypM4A "sv,
                           "FORM\0\0\x8a\x06"
                           "AIFFCOMM"sv,
                           "RIFF\0\0\0\0WAVEfmt "sv, "OggS\0"sv, "ID3\4"sv, "\xff\xfb\x90"sv})
    EXPECT_TRUE(looksLikeSound(bytes)) << bytes;
  for (const auto bytes : {""sv, "\xff"sv, "ftyp"sv, "FORM"sv, "RIFF\0\0\0\0AVI LIST"sv,
                           "no sound at all"sv, "\xff\x0a"sv})
    EXPECT_FALSE(looksLikeSound(bytes)) << bytes;
}

}  // namespace
}  // namespace Varnel::Platform
