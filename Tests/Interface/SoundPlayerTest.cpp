// SPDX-License-Identifier: MIT
#include <gst/app/gstappsink.h>
#include <gtest/gtest.h>
#include <stdlib.h>

#include <algorithm>
#include <cmath>
#include <mutex>
#include <vector>

#include <Tests/Support/DrainUntil.h>
#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Interface/SoundEngine.h>
#include <Varnel/Platform/Generic/BackgroundSoundPlayer.h>
#include <Varnel/Platform/Linux/Adapters.h>
#include <Varnel/Platform/Linux/Sounds/GStreamer/Output.h>
#include <Varnel/Platform/Ports/ReadFile.h>

namespace Varnel {
namespace {

constexpr double rate = 44100;

// What a sound was decoded to: one channel of samples from -1 to 1.
class Recording {
 public:
  Recording() = default;

  // The sink is not paced by a clock, so that a sound is over as soon as it is decoded.
  GstElement* makeSink() {
    GstElement* sink = gst_element_factory_make("appsink", nullptr);
    GstCaps* form =
        gst_caps_from_string("audio/x-raw,format=F32LE,layout=interleaved,channels=1,rate=44100");
    g_object_set(sink, "sync", FALSE, "caps", form, nullptr);
    gst_caps_unref(form);
    GstAppSinkCallbacks callbacks{};
    callbacks.new_sample = &Recording::take;
    gst_app_sink_set_callbacks(GST_APP_SINK(sink), &callbacks, this, nullptr);
    return sink;
  }

  double seconds() {
    const std::lock_guard lock(mutex_);
    return static_cast<double>(samples_.size()) / rate;
  }

  // The highest sample within the first so many seconds.
  double peak(double within = 10) {
    const std::lock_guard lock(mutex_);
    const auto count = std::min(samples_.size(), static_cast<std::size_t>(within * rate));
    float highest = 0;
    for (std::size_t i = 0; i < count; ++i) highest = std::max(highest, std::abs(samples_[i]));
    return highest;
  }

  // The root mean square in decibels below full scale.
  double loudness() {
    const std::lock_guard lock(mutex_);
    double sum = 0;
    for (const float sample : samples_) sum += static_cast<double>(sample) * sample;
    return 10 * std::log10(sum / static_cast<double>(samples_.size()));
  }

 private:
  static GstFlowReturn take(GstAppSink* sink, void* self) {
    GstSample* sample = gst_app_sink_pull_sample(sink);
    GstMapInfo content;
    gst_buffer_map(gst_sample_get_buffer(sample), &content, GST_MAP_READ);
    auto& recording = *static_cast<Recording*>(self);
    {
      const std::lock_guard lock(recording.mutex_);
      const auto* first = reinterpret_cast<const float*>(content.data);
      recording.samples_.insert(recording.samples_.end(), first,
                                first + content.size / sizeof(float));
    }
    gst_buffer_unmap(gst_sample_get_buffer(sample), &content);
    gst_sample_unref(sample);
    return GST_FLOW_OK;
  }

  std::mutex mutex_;  // Owns samples_, which the pipeline's thread adds to.
  std::vector<float> samples_;
};

std::string bytesOf(Sound sound) {
  return *Platform::readFile(VARNEL_SOUNDS "/" + sound.fileName());
}

// An engine whose sounds are recorded, one recording a sound played.
class SoundPlayerTest : public ::testing::Test {
 protected:
  SoundPlayerTest() {
    ::setenv("GST_REGISTRY", VARNEL_GSTREAMER_REGISTRY, 1);
    // Whatever this machine has to play sounds on stays silent.
    ::setenv("PULSE_SERVER", "unix:/nonexistent", 1);
    ::setenv("PULSE_CLIENTCONFIG", "/dev/null", 1);
  }

  bool drainUntilIdle() {
    return Tests::drainUntil(*mainQueue, [this] { return !engine.currentSound(); });
  }

  // The engine finds these bytes for every sound.
  void putInPlace(const std::string& bytes) { path = folder.write("sound", bytes); }

  const Tests::TemporaryFolder folder;
  const std::unique_ptr<Platform::MainQueue> mainQueue = Platform::Linux::makeMainQueue();
  std::optional<std::string> path;
  std::vector<std::unique_ptr<Recording>> recordings;  // The player's while a sound plays.
  Platform::BackgroundSoundPlayer player{
      *mainQueue, [this] {
        return std::make_unique<Platform::GStreamer::Output>(
            [this] { return recordings.emplace_back(std::make_unique<Recording>())->makeSink(); });
      }};
  SoundEngine engine{{.player = player, .path = [this](Sound sound) {
                        return path ? *path : VARNEL_SOUNDS "/" + sound.fileName();
                      }}};
};

TEST_F(SoundPlayerTest, EverySoundBeginsInSilenceAndIsShortSmallAndAsLoudAsTheOthers) {
  const std::pair<Sound, double> durations[] = {
      {Sound::tutorial, 0.86},
      {Sound::start, 1.56},
      {Sound::scanComplete, 1.26},
      {Sound::cleanComplete, 1.66},
      {Sound::achievementNotification, 1.16},
      {Sound::rankIncreased, 1.96},
      {Sound::purchase, 0.86},
  };
  for (const auto& [sound, seconds] : durations) {
    SCOPED_TRACE(sound.fileName());
    EXPECT_LT(bytesOf(sound).size(), 40'000u);
    engine.play(sound);
    ASSERT_TRUE(engine.currentSound());
    ASSERT_TRUE(drainUntilIdle());
    EXPECT_NEAR(recordings.back()->seconds(), seconds, 0.06);
    EXPECT_NEAR(recordings.back()->loudness(), -19, 2);
    EXPECT_LT(recordings.back()->peak(), 0.9);
    EXPECT_LT(recordings.back()->peak(0.02), 0.001) << "a first sample that is loud clicks";
    EXPECT_GT(recordings.back()->peak(0.09), 0.2) << "the attack follows the silence";
  }
}

TEST_F(SoundPlayerTest, DamagedFilesAreSilentAndACutOneEndsEarly) {
  const std::string whole = bytesOf(Sound::start);
  std::string mangled = whole;
  for (std::size_t i = 200; i < mangled.size(); i += 3) mangled[i] = static_cast<char>(i);
  for (const std::string& bytes : {std::string("no sound at all"), std::string(), mangled,
                                   whole.substr(0, 40), whole.substr(0, 600)}) {
    SCOPED_TRACE(bytes.size());
    putInPlace(bytes);
    engine.play(Sound::start);
    EXPECT_TRUE(drainUntilIdle());
  }
  putInPlace(whole.substr(0, whole.size() * 2 / 3));
  engine.play(Sound::start);
  ASSERT_TRUE(drainUntilIdle());
  EXPECT_GT(recordings.back()->seconds(), 0.5);
  EXPECT_LT(recordings.back()->seconds(), 1.35);
}

}  // namespace
}  // namespace Varnel
