// SPDX-License-Identifier: MIT
// How long the main thread waits for a sound: the calls of the engine, beside the start of the same
// sound in place, which is what a thread of its own does for them.
#include <fstream>
#include <memory>
#include <sstream>
#include <string>
#include <vector>

#include <Benchmarks/Measurements.h>
#include <Varnel/Interface/SoundEngine.h>
#include <Varnel/Platform/Generic/SoundOutput.h>
#include <Varnel/Platform/Linux/Adapters.h>
#include <Varnel/Platform/Linux/Sounds/GStreamer/Module.h>
#include <Varnel/Platform/Ports/MainQueue.h>
#include <Varnel/Platform/Ports/SystemLog.h>

namespace {

using namespace Varnel;
using namespace Benchmarks;

constexpr int rounds = 30;
constexpr Nanoseconds millisecond = 1e6;

class Silent final : public Platform::SystemLog {
 public:
  void write(std::string_view) override {}
};

std::string pathOf(Sound sound) {
  return VARNEL_SOUNDS "/" + sound.fileName();
}

std::string bytesOf(Sound sound) {
  std::ostringstream bytes;
  bytes << std::ifstream(pathOf(sound), std::ios::binary).rdbuf();
  return std::move(bytes).str();
}

}  // namespace

int main() {
  const auto mainQueue = Platform::Linux::makeMainQueue();
  Silent systemLog;
  const auto player = Platform::Linux::makeSoundPlayer(systemLog, *mainQueue);
  SoundEngine engine({.player = *player, .path = &pathOf});
  const auto play = [&] { engine.play(Sound::scanComplete); };
  const auto awaitEnd = [&] { mainQueue->runWhile([&] { return !!engine.currentSound(); }); };

  // GStreamer starts meanwhile, elsewhere.
  report("the first sound / 1 ms", timeOf(play), millisecond, 1.0);
  awaitEnd();
  std::vector<Nanoseconds> plays, replacements, stops;
  for (int round = 0; round < rounds; ++round) {
    plays.push_back(timeOf(play));
    replacements.push_back(timeOf(play));
    stops.push_back(timeOf([&] { engine.stop(); }));
  }
  report("a later sound, worst / 1 ms", percentile(plays, 1), millisecond, 1.0);
  report("a sound that cuts off another, worst / 1 ms", percentile(replacements, 1), millisecond,
         1.0);
  report("stop of a sound, worst / 1 ms", percentile(stops, 1), millisecond, 1.0);
  play();
  awaitEnd();

  const std::unique_ptr<Platform::SoundOutput> output(varnelMakeSoundOutput());
  const std::string bytes = bytesOf(Sound::scanComplete);
  std::vector<Nanoseconds> starts;
  for (int round = 0; round < rounds; ++round)
    starts.push_back(timeOf([&] { static_cast<void>(output->start(bytes, [](bool) {})); }));
  report("a later sound, median / start and stop in place", median(plays), median(starts));
}
