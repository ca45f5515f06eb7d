// SPDX-License-Identifier: MIT
#include <Varnel/DiskAccess/DiskReadingLine.h>

#include <limits>
#include <utility>

#include <Varnel/DiskAccess/DiskReadingRequest.h>

namespace Varnel {

void DiskReadingLine::add(Request request) {
  Class& own = classOf(*request);
  request->sweep = own.sweep + (own.head && placeOf(*request) <= *own.head ? 1 : 0);
  const Key key = keyOf(*request);
  own.requests.emplace(key, std::move(request));
  ++size_;
}

void DiskReadingLine::remove(const DiskReadingRequest& request) {
  size_ -= classOf(request).requests.erase(keyOf(request));
}

std::optional<int> DiskReadingLine::urgency() const {
  for (std::size_t i = 0; i < classes_.size(); ++i)
    if (!classes_[i].requests.empty()) return static_cast<int>(i);
  return std::nullopt;
}

DiskReadingLine::Request DiskReadingLine::next(int urgency) const {
  const auto mostUrgent = this->urgency();
  if (!mostUrgent || *mostUrgent > urgency) return nullptr;
  return classes_[static_cast<std::size_t>(*mostUrgent)].requests.begin()->second;
}

DiskReadingLine::Request DiskReadingLine::take(int urgency) {
  Request request = next(urgency);
  if (request) {
    Class& own = classOf(*request);
    own.sweep = request->sweep;
    own.head = placeOf(*request);
    remove(*request);
  }
  return request;
}

std::uint64_t DiskReadingLine::placeOf(const DiskReadingRequest& request) const {
  return seeks_ == Seeks::costNothing
             ? 0
             : request.place.value_or(std::numeric_limits<std::uint64_t>::max());
}

DiskReadingLine::Key DiskReadingLine::keyOf(const DiskReadingRequest& request) const {
  return {request.sweep, placeOf(request), request.number};
}

DiskReadingLine::Class& DiskReadingLine::classOf(const DiskReadingRequest& request) {
  return classes_[static_cast<std::size_t>(request.urgency)];
}

}  // namespace Varnel
