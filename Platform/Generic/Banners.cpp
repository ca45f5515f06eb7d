// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Generic/Banners.h>

#include <charconv>
#include <utility>

namespace Varnel::Platform {
namespace {

using enum DeliveryState;

// A banner's token is the number of its delivery.
std::string tokenOf(std::int64_t number) {
  return std::to_string(number);
}

std::int64_t numberOf(const std::string& token) {
  std::int64_t number = 0;
  std::from_chars(token.data(), token.data() + token.size(), number);
  return number;
}

Banner bannerOf(const UserNotification& notification) {
  return {.title = notification.title.value_or(""),
          .text = notification.informativeText.value_or(""),
          .actionTitle = notification.actionButtonTitle.value_or(""),
          .dismissTitle = notification.otherButtonTitle.value_or("")};
}

}  // namespace

Banners::Banners(NotificationServer& server, NotificationStore& store, Events events)
    : server_(server), store_(store), events_(std::move(events)) {}

Banners::Failure Banners::catchUp() {
  if (notes_.empty()) return std::nullopt;
  std::vector<Note> orphans;
  const auto error = store_.change([&]() -> Failure {
    orphans.clear();
    for (const Note& each : notes_)
      if (auto failure = write(each, orphans)) return failure;
    return std::nullopt;
  });
  if (error) return error;
  notes_.clear();
  for (const Note& orphan : orphans) server_.close(tokenOf(orphan.number), orphan.reference);
  return std::nullopt;
}

Banners::Failure Banners::write(const Note& note, std::vector<Note>& orphans) {
  if (note.reference) {
    const auto isThere = store_.noteShown(note.number, *note.reference);
    if (!isThere) return isThere.error();
    // It was removed while the server was busy showing it.
    if (!*isThere) orphans.push_back(note);
    return std::nullopt;
  }
  auto error = store_.noteGone(note.number);
  return error || !note.isDismissed ? error : store_.remove(note.number);
}

bool Banners::isToShow(const Delivery& delivery) const {
  return delivery.state == toShow && !failed_.contains(delivery.number) &&
         !shown_.contains(delivery.number);
}

Banners::Failure Banners::follow(const std::vector<Delivery>& all, bool mayShow, std::size_t max) {
  std::set<std::int64_t> present;
  bool isFirst = true;
  // The earliest first, as they came due.
  for (auto each = all.rbegin(); each != all.rend(); ++each) {
    present.insert(each->number);
    if (mayShow && isToShow(*each) && onTheirWay_.size() < max) {
      if (std::exchange(isFirst, false)) {
        const auto source = store_.source();
        if (!source) return source.error();
        source_ = *source;
        if (source_) server_.setSource(*source_);
      }
      show(*each);
    }
    if ((each->state == hidden || each->state == removed) && each->banner) close(*each);
  }
  std::erase_if(shown_, [&](const auto& each) {
    if (present.contains(each.first)) return false;
    onTheirWay_.erase(each.first);
    server_.close(tokenOf(each.first), std::nullopt);
    return true;
  });
  return std::nullopt;
}

void Banners::show(const Delivery& delivery) {
  shown_.emplace(delivery.number, delivery.schedule.notification);
  onTheirWay_.insert(delivery.number);
  server_.show(tokenOf(delivery.number), bannerOf(delivery.schedule.notification), delivery.banner);
}

void Banners::close(const Delivery& delivery) {
  shown_.erase(delivery.number);
  onTheirWay_.erase(delivery.number);
  if (!failed_.contains(delivery.number) && closing_.insert(delivery.number).second)
    server_.close(tokenOf(delivery.number), delivery.banner);
}

bool Banners::isIdle() const {
  return notes_.empty() && onTheirWay_.empty() && up_.empty() && closing_.empty();
}

void Banners::note(Note note) {
  notes_.push_back(std::move(note));
  events_.changed();
}

void Banners::gone(std::int64_t number, bool isDismissed) {
  onTheirWay_.erase(number);
  up_.erase(number);
  closing_.erase(number);
  note({.number = number, .reference = std::nullopt, .isDismissed = isDismissed});
}

void Banners::bannerShown(const std::string& token, const std::string& reference) {
  const std::int64_t number = numberOf(token);
  onTheirWay_.erase(number);
  up_.insert(number);
  note({.number = number, .reference = reference});
}

void Banners::bannerFailed(const std::string& token) {
  const std::int64_t number = numberOf(token);
  shown_.erase(number);
  onTheirWay_.erase(number);
  closing_.erase(number);
  failed_.insert(number);
  events_.changed();
}

void Banners::bannerActivated(const std::string& token, const BannerActivation& activation) {
  auto shown = shown_.extract(numberOf(token));
  if (!shown) return;
  gone(shown.key(), false);
  if (!activation.activationToken.empty())
    shown.mapped().activationToken = activation.activationToken;
  events_.activated({std::move(shown.mapped()), activation.isActionButton});
}

void Banners::bannerDismissed(const std::string& token) {
  shown_.erase(numberOf(token));
  gone(numberOf(token), true);
}

void Banners::bannerGone(const std::string& token) {
  gone(numberOf(token), false);
}

void Banners::serverAppeared() {
  failed_.clear();
  events_.changed();
}

}  // namespace Varnel::Platform
