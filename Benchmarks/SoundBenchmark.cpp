// SPDX-License-Identifier: MIT
// How long the main thread waits for a sound: the calls of the engine, beside the start of the same
// sound in place, which is what a thread of its own does for them.
#include <cstdio>
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
using Benchmarks::Nanoseconds;
using Benchmarks::percentile;
using Benchmarks::timeOf;

constexpr int rounds = 30;
constexpr Nanoseconds goal = 1e6;

class Silent final : public Platform::SystemLog {
 public:
  void write(std::string_view) override {}
};

enum class Goal { met, none };

std::string pathOf(Sound sound) {
  return VARNEL_SOUNDS "/" + sound.fileName();
}

std::string bytesOf(Sound sound) {
  std::ostringstream bytes;
  bytes << std::ifstream(pathOf(sound), std::ios::binary).rdbuf();
  return std::move(bytes).str();
}

void print(const char* what, const std::vector<Nanoseconds>& samples, Goal wanted = Goal::met) {
  const Nanoseconds worst = percentile(samples, 1);
  std::printf("%-44s %10.3f %10.3f  %s\n", what, percentile(samples, 0.5) / 1e6, worst / 1e6,
              wanted == Goal::none ? ""
              : worst <= goal      ? "met"
                                   : "NOT met");
}

}  // namespace

int main() {
  const auto mainQueue = Platform::Linux::makeMainQueue();
  Silent systemLog;
  const auto player = Platform::Linux::makeSoundPlayer(systemLog, *mainQueue);
  SoundEngine engine({.player = *player, .path = &pathOf});
  const auto play = [&] { engine.play(Sound::scanComplete); };
  const auto awaitEnd = [&] { mainQueue->runWhile([&] { return !!engine.currentSound(); }); };

  std::printf("%-44s %10s %10s  goal: %.0f ms\n", "", "median, ms", "worst, ms", goal / 1e6);
  // GStreamer starts meanwhile, elsewhere.
  print("the first sound of the process", {timeOf(play)});
  awaitEnd();
  std::vector<Nanoseconds> plays, replacements, stops;
  for (int round = 0; round < rounds; ++round) {
    plays.push_back(timeOf(play));
    replacements.push_back(timeOf(play));
    stops.push_back(timeOf([&] { engine.stop(); }));
  }
  print("a later sound", plays);
  print("a sound that cuts off another", replacements);
  print("stop", stops);
  play();
  awaitEnd();

  const std::unique_ptr<Platform::SoundOutput> output(varnelMakeSoundOutput());
  const std::string bytes = bytesOf(Sound::scanComplete);
  std::vector<Nanoseconds> starts;
  for (int round = 0; round < rounds; ++round)
    starts.push_back(timeOf([&] { static_cast<void>(output->start(bytes, [](bool) {})); }));
  print("for comparison: start and stop in place", starts, Goal::none);
}
