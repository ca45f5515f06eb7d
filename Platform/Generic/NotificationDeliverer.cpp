// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Generic/NotificationDeliverer.h>

#include <algorithm>
#include <utility>

#include <Varnel/Platform/Generic/Banners.h>
#include <Varnel/Platform/Ports/Clock.h>
#include <Varnel/Platform/Ports/MainQueue.h>
#include <Varnel/Platform/Ports/PrivateFiles.h>
#include <Varnel/Platform/Ports/SystemLog.h>
#include <Varnel/Platform/Ports/TimeZones.h>
#include <Varnel/Platform/Ports/UserLocale.h>
#include <Varnel/Platform/Ports/WallClockTimer.h>
#include <Varnel/Platform/Text/Calendar.h>
#include <Varnel/Platform/Values/Restorer.h>

namespace Varnel::Platform {
namespace {

using enum DeliveryState;

// It will not become usable by waiting.
bool isOfOthers(const PlatformError& error) {
  const SQLiteFailure meaning = meaningOf(error);
  return meaning == SQLiteFailure::newer || meaning == SQLiteFailure::older ||
         meaning == SQLiteFailure::refused;
}

}  // namespace

NotificationDeliverer::NotificationDeliverer(const Ports& ports, const std::string& storeFile,
                                             Migrating migrating, NotificationHosts& hosts)
    : ports_(ports),
      storeFile_(storeFile),
      migrating_(migrating),
      hosts_(hosts),
      store_(std::in_place, DurableFile::Ports{ports.privateFiles, ports.systemLog}, storeFile,
             migrating),
      banners_(std::make_shared<Banners>(
          ports.notificationServer, *store_,
          Banners::Events{.changed = [this] { recheckSoon(); },
                          .activated = [this](const auto& it) { hosts_.didActivate(it); }})) {
  ports_.notificationServer.setObserver(banners_);
  ports_.timer.setHandler([this] { tick(); });
}

NotificationDeliverer::~NotificationDeliverer() {
  ports_.timer.disarm();
  ports_.timer.setHandler(nullptr);
}

void NotificationDeliverer::setDuty(Duty duty) {
  duty_ = duty;
  recheck();
}

// A host that changes the store when it is asked finds this occupied.
void NotificationDeliverer::recheck() {
  if (isOccupied_) return recheckSoon();
  {
    const Restorer occupied(isOccupied_);
    isOccupied_ = true;
    isBehind_ = false;
    const Failure failure = follow();
    report(failure);
    if (failure) isAllDone_ = isOfOthers(*failure);
    isBehind_ = isBehind_ || failure || banners_->hasFailed();
  }
  awaitNext();
}

bool NotificationDeliverer::isStoreThere() const {
  return migrating_ == Migrating::allowed || ports_.privateFiles.identity(storeFile_);
}

NotificationDeliverer::Failure NotificationDeliverer::follow() {
  if (!isStoreThere()) {
    // What it held was removed on purpose and must not come back with the next file.
    store_.emplace(DurableFile::Ports{ports_.privateFiles, ports_.systemLog}, storeFile_,
                   migrating_);
    questions_.clear();
    banners_->dropNotes();
    lookAhead({});
    return banners_->follow({}, false, 0);
  }
  auto error = banners_->catchUp();
  return error ? error : deliver();
}

NotificationDeliverer::Failure NotificationDeliverer::deliver() {
  const std::vector every{planned, due, hidden, toShow, shown, expired, removed};
  auto all = store_->deliveries(every);
  if (!all) return all.error();
  const Date now = ports_.clock.now();
  if (auto error = becomeDeliverer(*all, now)) return error;
  // Where nothing is due, a schedule may still have to go on from a clock that was set back.
  if (duty_ == Duty::everything && !isBehind_) {
    if (auto error = store_->claimDue(now, calendar())) return error;
    if (all = store_->deliveries(every); !all) return all.error();
  }
  const bool mayDeliver = lock_ && duty_ != Duty::nothing;
  if (mayDeliver) {
    ask(*all);
    if (auto error = decide()) return error;
    if (all = store_->deliveries(every); !all) return all.error();
  }
  lookAhead(*all);
  return banners_->follow(*all, mayDeliver, maxOnTheirWay);
}

// Where there is something to deliver. Succeeds also where somebody else is the deliverer.
NotificationDeliverer::Failure NotificationDeliverer::becomeDeliverer(
    const std::vector<Delivery>& all, Date now) {
  if (duty_ == Duty::nothing && !isBusy()) lock_.reset();
  if (duty_ == Duty::nothing || lock_) return std::nullopt;
  const Calendar present = calendar();
  const auto isDue = [&](const Delivery& each) {
    if (each.state != planned) return each.state == due || banners_->isToShow(each);
    return duty_ == Duty::everything &&
           nextDate(each.schedule, present).value_or(Date::max()) <= now;
  };
  if (std::none_of(all.begin(), all.end(), isDue)) return std::nullopt;
  auto lock = ports_.privateFiles.tryLock(storeFile_ + ".deliverer");
  if (!lock) return lock.error();
  if (!*lock) {
    // The other one may end before it has done everything.
    isBehind_ = true;
    return std::nullopt;
  }
  // Whoever showed banners has ended.
  if (auto error = store_->noteAllExpired()) return error;
  lock_ = std::move(*lock);
  return std::nullopt;
}

void NotificationDeliverer::ask(const std::vector<Delivery>& all) {
  std::map<std::int64_t, Question> before;
  before.swap(questions_);
  // The earliest first, as they came due.
  for (auto each = all.rbegin(); each != all.rend(); ++each) {
    if (each->state != due) continue;
    if (auto asked = before.extract(each->number)) {
      questions_.insert(std::move(asked));
      continue;
    }
    questions_.emplace(each->number, Question{.asked = ports_.clock.now(), .answer = std::nullopt});
    hosts_.shouldPresent(each->schedule.notification, [this, life = std::weak_ptr(banners_),
                                                       number = each->number](bool isToShow) {
      if (!life.expired()) take(number, isToShow);
    });
  }
}

void NotificationDeliverer::take(std::int64_t number, bool isToShow) {
  const auto question = questions_.find(number);
  if (question == questions_.end() || question->second.answer) return;
  question->second.answer = isToShow;
  // Many that are due at once are decided at once.
  const bool isLast = std::all_of(questions_.begin(), questions_.end(),
                                  [](const auto& each) { return each.second.answer.has_value(); });
  if (isLast && !isOccupied_) recheckSoon();
}

// A question from the future was asked before the clock was set back.
bool NotificationDeliverer::isOverdue(const Question& question) const {
  const Date now = ports_.clock.now();
  return !question.answer && (now >= question.asked + maxQuestion || now < question.asked);
}

// Of all that are answered, as soon as none is open or one has been for too long.
NotificationDeliverer::Failure NotificationDeliverer::decide() {
  std::map<std::int64_t, bool> decisions;
  bool isAnyOpen = false;
  bool isAnyOverdue = false;
  for (const auto& [number, question] : questions_) {
    const bool isLate = isOverdue(question);
    isAnyOverdue = isAnyOverdue || isLate;
    if (question.answer || isLate)
      decisions.emplace(number, question.answer.value_or(true));
    else
      isAnyOpen = true;
  }
  if (decisions.empty() || (isAnyOpen && !isAnyOverdue)) return std::nullopt;
  const auto delivered = store_->decideDue(decisions);
  if (!delivered) return delivered.error();
  std::erase_if(questions_, [&](const auto& each) { return decisions.contains(each.first); });
  for (const Delivery& each : *delivered) hosts_.didDeliver(each.schedule.notification);
  return std::nullopt;
}

void NotificationDeliverer::lookAhead(const std::vector<Delivery>& all) {
  nextPlanned_.reset();
  isAllDone_ = true;
  const Calendar present = calendar();
  for (const Delivery& each : all) {
    if (each.state == due || each.state == toShow) isAllDone_ = false;
    if ((each.state == hidden || each.state == removed) && each.banner) isAllDone_ = false;
    if (each.state != planned || duty_ != Duty::everything) continue;
    const auto date = nextDate(each.schedule, present);
    if (!date) continue;
    isAllDone_ = false;
    // What is due and could not be claimed keeps no other one back.
    if (*date <= ports_.clock.now() && isBehind_) continue;
    nextPlanned_ = std::min(nextPlanned_.value_or(Date::max()), *date);
  }
}

bool NotificationDeliverer::isIdle() const {
  return isAllDone_ && isQuiet();
}

bool NotificationDeliverer::isQuiet() const {
  return questions_.empty() && banners_->isIdle() && !isBusy();
}

bool NotificationDeliverer::isBusy() const {
  return isPosted_ || ports_.notificationServer.isBusy();
}

NotificationDeliverer::Failure NotificationDeliverer::keepLaunch(
    const NotificationActivation& activation) {
  if (!isStoreThere()) return std::nullopt;
  return store_->keepLaunch(activation.notification, ports_.clock.now());
}

Result<std::optional<NotificationSource>> NotificationDeliverer::source() {
  if (!isStoreThere()) return std::optional<NotificationSource>();
  auto source = store_->source();
  if (!source && banners_->source()) return banners_->source();
  return source;
}

// Others may take longer with the store than anybody here waits for them. That is said when it
// lasts.
void NotificationDeliverer::report(const Failure& failure) {
  const Date now = ports_.clock.now();
  if (!failure || meaningOf(*failure) != SQLiteFailure::busy)
    busySince_.reset();
  else if (!busySince_)
    busySince_ = now;
  if (busySince_ && now < *busySince_ + minPause) return;
  const std::string text = failure ? failure->localizedDescription() : "";
  if (failure && text != lastReport_) ports_.systemLog.write("Notifications have to wait: " + text);
  lastReport_ = text;
}

// What happens at about the same time is written together. While many banners are on their way it
// is enough to note what became of the others.
void NotificationDeliverer::recheckSoon() {
  if (std::exchange(isPosted_, true)) return;
  ports_.mainQueue.post([this, life = std::weak_ptr(banners_)] {
    if (life.expired()) return;
    isPosted_ = false;
    if (banners_->onTheirWay() > maxOnTheirWay / 2 && !isOccupied_ && isStoreThere() &&
        !banners_->catchUp())
      return;
    recheck();
  });
}

// The user's present time zone.
Calendar NotificationDeliverer::calendar() const {
  return {ports_.userLocale, ports_.timeZones};
}

void NotificationDeliverer::tick() {
  if (isToRetry_ && pause_.isOver(ports_.clock.now())) {
    isToRetry_ = false;
    banners_->tryFailedAgain();
  }
  recheck();
}

void NotificationDeliverer::awaitNext() {
  const Date now = ports_.clock.now();
  next_.reset();
  const auto wait = [this](Date date) { next_ = std::min(next_.value_or(Date::max()), date); };
  // What could not be done in its time waits for the next try.
  const auto isToCome = [&](Date date) { return date > now || !isBehind_; };
  if (nextPlanned_ && isToCome(*nextPlanned_)) wait(*nextPlanned_);
  for (const auto& [number, question] : questions_)
    if (isToCome(question.asked + maxQuestion)) wait(question.asked + maxQuestion);
  if (isBehind_) {
    if (!std::exchange(isToRetry_, true)) pause_.failed(now);
    wait(pause_.end());
  } else {
    isToRetry_ = false;
    if (!isBusy()) pause_.succeeded();
  }
  if (next_)
    ports_.timer.arm(*next_);
  else
    ports_.timer.disarm();
}

}  // namespace Varnel::Platform
