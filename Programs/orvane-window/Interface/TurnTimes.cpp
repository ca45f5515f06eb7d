// SPDX-License-Identifier: MIT
#include <orvane-window/Interface/TurnTimes.h>

#include <fmt/format.h>
#include <glib.h>

#include <algorithm>
#include <ctime>

namespace Orvane {
namespace {

constexpr std::chrono::milliseconds maxTurn(50);
TurnTimes* current = nullptr;

std::chrono::nanoseconds clockTime(clockid_t clock) {
  timespec time{};
  clock_gettime(clock, &time);
  return std::chrono::seconds(time.tv_sec) + std::chrono::nanoseconds(time.tv_nsec);
}

double milliseconds(std::chrono::nanoseconds time) {
  return std::chrono::duration<double, std::milli>(time).count();
}

}  // namespace

TurnTimes::Moment TurnTimes::now() {
  return {clockTime(CLOCK_THREAD_CPUTIME_ID), clockTime(CLOCK_MONOTONIC)};
}

TurnTimes::TurnTimes() {
  current = this;
  g_main_context_set_poll_func(nullptr, &TurnTimes::poll);
}

TurnTimes::~TurnTimes() {
  g_main_context_set_poll_func(nullptr, nullptr);
  current = nullptr;
}

int TurnTimes::poll(GPollFD* descriptors, unsigned count, int timeout) {
  current->endTurn();
  const int ready = g_poll(descriptors, count, timeout);
  current->beginTurn();
  return ready;
}

void TurnTimes::beginPhase(const std::string& name) {
  if (current && current->phases_.back().name != name) current->phases_.push_back({name});
}

void TurnTimes::beginTurn() {
  begin_ = now();
  phaseOfTurn_ = phases_.size() - 1;
}

void TurnTimes::endTurn() {
  const Moment end = now();
  const Time processor = end.processor - begin_.processor;
  Phase& phase = phases_[phaseOfTurn_];
  ++phase.turns;
  if (processor > maxTurn) ++phase.longTurns;
  phase.longest.processor = std::max(phase.longest.processor, processor);
  phase.longest.wall = std::max(phase.longest.wall, end.wall - begin_.wall);
}

std::string TurnTimes::text() const {
  std::string text;
  for (const Phase& phase : phases_)
    text += fmt::format(
        "{}: {} turns; the longest: {:.1f} ms of the processor ({} above {} ms), {:.1f} ms on the "
        "wall\n",
        phase.name, phase.turns, milliseconds(phase.longest.processor), phase.longTurns,
        maxTurn.count(), milliseconds(phase.longest.wall));
  return text;
}

}  // namespace Orvane
