// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Generic/SharedWallClockTimer.h>

#include <algorithm>
#include <iterator>
#include <utility>
#include <vector>

#include <Varnel/Platform/Ports/Clock.h>

namespace Varnel::Platform {

class SharedWallClockTimer::Share final : public WallClockTimer {
 public:
  explicit Share(SharedWallClockTimer& shared) : shared_(shared) { shared_.shares_.insert(this); }
  ~Share() override {
    shared_.shares_.erase(this);
    shared_.rearm();
  }
  Share(const Share&) = delete;
  Share& operator=(const Share&) = delete;

  void setHandler(std::function<void()> handler) override { handler_ = std::move(handler); }
  void arm(Date date) override {
    date_ = date;
    shared_.rearm();
  }
  void disarm() override {
    date_.reset();
    shared_.rearm();
  }

  [[nodiscard]] const std::optional<Date>& date() const { return date_; }
  void ring() {
    date_.reset();
    if (handler_) handler_();
  }

 private:
  SharedWallClockTimer& shared_;
  std::function<void()> handler_;
  std::optional<Date> date_;
};

SharedWallClockTimer::SharedWallClockTimer(const Clock& clock, WallClockTimer& timer)
    : clock_(clock), timer_(timer) {
  timer_.setHandler([this] { ring(); });
}

SharedWallClockTimer::~SharedWallClockTimer() {
  timer_.disarm();
  timer_.setHandler(nullptr);
}

std::unique_ptr<WallClockTimer> SharedWallClockTimer::share() {
  return std::make_unique<Share>(*this);
}

void SharedWallClockTimer::rearm() {
  if (isRinging_) return;
  std::optional<Date> next;
  for (const Share* share : shares_)
    if (share->date()) next = std::min(next.value_or(Date::max()), *share->date());
  if (next)
    timer_.arm(*next);
  else
    timer_.disarm();
}

// Where nobody's date has come, the clock was set, which concerns all.
void SharedWallClockTimer::ring() {
  const Date now = clock_.now();
  std::vector<Share*> armed;
  for (Share* share : shares_)
    if (share->date()) armed.push_back(share);
  std::vector<Share*> reached;
  std::copy_if(armed.begin(), armed.end(), std::back_inserter(reached),
               [now](const Share* share) { return *share->date() <= now; });
  isRinging_ = true;
  for (Share* share : reached.empty() ? armed : reached)
    // A handler may have ended another share, or disarmed it.
    if (shares_.contains(share) && share->date()) share->ring();
  isRinging_ = false;
  rearm();
}

}  // namespace Varnel::Platform
