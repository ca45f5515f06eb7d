// SPDX-License-Identifier: MIT
#include <Varnel/DiskAccess/DiskReadingLine.h>

#include <limits>
#include <utility>

#include <Varnel/DiskAccess/DiskReadingRequest.h>

namespace Varnel {

void DiskReadingLine::add(Request request) {
  const Key key = keyOf(*request);
  classes_[static_cast<std::size_t>(request->urgency)].emplace(key, std::move(request));
  ++size_;
}

void DiskReadingLine::remove(const DiskReadingRequest& request) {
  size_ -= classes_[static_cast<std::size_t>(request.urgency)].erase(keyOf(request));
}

std::optional<int> DiskReadingLine::urgency() const {
  for (std::size_t i = 0; i < classes_.size(); ++i)
    if (!classes_[i].empty()) return static_cast<int>(i);
  return std::nullopt;
}

DiskReadingLine::Request DiskReadingLine::next(int urgency) const {
  const auto mostUrgent = this->urgency();
  if (!mostUrgent || *mostUrgent > urgency) return nullptr;
  const auto& requests = classes_[static_cast<std::size_t>(*mostUrgent)];
  const auto above = requests.lower_bound({head_, 0});
  return above == requests.end() ? requests.begin()->second : above->second;
}

DiskReadingLine::Request DiskReadingLine::take(int urgency) {
  Request request = next(urgency);
  if (request) {
    head_ = keyOf(*request).place;
    remove(*request);
  }
  return request;
}

DiskReadingLine::Key DiskReadingLine::keyOf(const DiskReadingRequest& request) const {
  if (seeks_ == Seeks::costNothing) return {0, request.number};
  return {request.place.value_or(std::numeric_limits<std::uint64_t>::max()), request.number};
}

}  // namespace Varnel
