// SPDX-License-Identifier: MIT
#include <Removal/Restoration.h>

#include <algorithm>
#include <utility>

#include <Removal/DiskPlace.h>

namespace Orvane {
namespace {

using Outcome = RestorationStep::Outcome;
using Problem = Restoration::Problem;
using Varnel::Platform::Trash;
using Varnel::Platform::TrashError;

bool isToGiveBack(const RemovalRecord& record) {
  return record.files > record.restored + record.lost;
}

Outcome outcomeOf(TrashError::Reason reason) {
  switch (reason) {
    case TrashError::Reason::emptied:
      return Outcome::emptied;
    case TrashError::Reason::occupied:
      return Outcome::occupied;
    case TrashError::Reason::noTrash:
      return Outcome::noTrash;
    default:
      return Outcome::failed;
  }
}

// Numbers of devices and inodes do not last.
bool isIn(const std::string& path, const Varnel::Platform::FileState& expected, Trash& trash) {
  const auto state = trash.state(path);
  return state && state->size == expected.size && state->modified == expected.modified &&
         state->nanoseconds == expected.nanoseconds;
}

void putBack(RestorationStep& step, Trash& trash) {
  const auto& file = step.entry.file;
  const auto error = trash.restore(file, Trash::Folders::recreate);
  if (!error) {
    step.outcome = Outcome::restored;
    return;
  }
  step.code = error->code;
  step.outcome = isIn(file.path, file.state, trash) ? Outcome::inPlace : outcomeOf(error->reason);
}

}  // namespace

Restoration::Restoration(Ports ports, std::optional<std::int64_t> number)
    : ports_(ports), wanted_(number) {}

std::optional<Problem> Restoration::begin() {
  const auto problem = [](const Varnel::Platform::PlatformError& error) {
    return Problem{.reason = Problem::Reason::journal, .description = error.localizedDescription()};
  };
  auto lock = ports_.journal.lock();
  if (!lock) return problem(lock.error());
  if (!*lock) return Problem{.reason = Problem::Reason::busy};
  lock_ = std::move(*lock);

  const auto removals = ports_.journal.removals();
  if (!removals) return problem(removals.error());
  const auto found =
      std::find_if(removals->begin(), removals->end(), [&](const RemovalRecord& each) {
        return wanted_ ? each.number == *wanted_ : isToGiveBack(each);
      });
  if (found == removals->end()) return Problem{.reason = Problem::Reason::unknown};
  record_ = *found;

  const auto entries = ports_.journal.entries(record_);
  if (!entries) return problem(entries.error());
  // Another disk may have had the place of the one that has them: who names it looks again.
  using enum RemovalJournal::State;
  for (auto entry = entries->rbegin(); entry != entries->rend(); ++entry)
    if (entry->state == moved || (wanted_ && entry->state == lost))
      steps_.push_back({.entry = *entry});
  return std::nullopt;
}

const RestorationStep* Restoration::next() {
  if (nextStep_ == steps_.size()) return nullptr;
  RestorationStep& step = steps_[nextStep_++];
  const auto place = placeOnDiskOf(step.entry.file.folder, ports_.disks);
  if (!place) {
    step.outcome = Outcome::noAccess;
    return &step;
  }
  putBack(step, ports_.trash);
  using State = RemovalJournal::State;
  if (step.outcome == Outcome::restored || step.outcome == Outcome::inPlace)
    step.entry.state = State::restored;
  if (step.outcome == Outcome::emptied) step.entry.state = State::lost;
  if (step.entry.state != State::moved)
    step.isUnnoted =
        ports_.journal.setState(record_, step.entry.file.path, step.entry.state).has_value();
  return &step;
}

}  // namespace Orvane
