// SPDX-License-Identifier: MIT
#include <Removal/Removal.h>

#include <algorithm>
#include <filesystem>
#include <utility>

#include <Removal/Comparison.h>
#include <Removal/DiskPlace.h>
#include <Removal/OpenedFile.h>
#include <Removal/PackagedFiles.h>
#include <Scan/FileSystem.h>
#include <Varnel/DiskAccess/DiskAccessManager.h>
#include <Varnel/Platform/Ports/Clock.h>

// A step ends in one of three ways: the file never left its place, and no note of it stays; it is
// in the trash, and noted; or the process ends, between note and move, and the note says too much,
// which a restoration sees. Nothing is done between the two but what makes sure that the other file
// stays.
namespace Orvane {
namespace {

using Outcome = RemovalStep::Outcome;
using Problem = Removal::Problem;
using Varnel::Platform::FileState;
using Varnel::Platform::Trash;
using Varnel::Platform::TrashedFile;
using Varnel::Platform::TrashError;

FileStatus statusOf(const FileState& state) {
  constexpr std::int64_t nanoseconds = 1'000'000'000;
  return {.identity = {.device = state.device, .inode = state.inode},
          .size = state.size,
          .modifiedAt = state.modified * nanoseconds + state.nanoseconds};
}

// Below what was named to the scan, and so is no secret.
bool isInHiddenFolder(const std::string& path, const std::vector<std::string>& roots) {
  std::size_t named = 0;
  for (const std::string& root : roots)
    if (isBelow(path, root)) named = std::max(named, root.find_last_not_of('/') + 1);
  const std::size_t dot = path.find("/.", named);
  return dot != std::string::npos && path.find('/', dot + 1) != std::string::npos;
}

std::string_view folderOf(std::string_view path) {
  return path.substr(0, path.rfind('/') + 1);
}

// Where it cannot be told there is one name, as nearly always.
std::uint64_t linksTo(const std::string& path) {
  std::error_code unknown;
  const auto count = std::filesystem::hard_link_count(path, unknown);
  return unknown ? 1 : count;
}

// Where it cannot be told, as scans count it then.
FileSpace spaceOf(const std::string& path, std::uint64_t size, FileSystem& fileSystem) {
  FileSpace space{.bytes = size};
  const auto file = openFile(path, fileSystem);
  if (!file) return space;
  if (const auto status = (*file)->status()) space.bytes = std::min(size, status->allocated);
  space.shared = (*file)->sharedExtents();
  return space;
}

Outcome outcomeOf(Comparison::Verdict verdict) {
  switch (verdict) {
    case Comparison::Verdict::different:
      return Outcome::different;
    case Comparison::Verdict::changed:
      return Outcome::changed;
    case Comparison::Verdict::unreadable:
      return Outcome::unreadable;
    case Comparison::Verdict::noAccess:
      return Outcome::noAccess;
    case Comparison::Verdict::stopped:
      return Outcome::stopped;
    case Comparison::Verdict::equal:
      break;
  }
  return Outcome::planned;
}

Outcome outcomeOf(TrashError::Reason reason, bool isKept) {
  switch (reason) {
    case TrashError::Reason::changed:
      return Outcome::changed;
    case TrashError::Reason::declined:
      return isKept ? Outcome::notJournalled : Outcome::changed;
    case TrashError::Reason::noTrash:
      return Outcome::noTrash;
    case TrashError::Reason::misplaced:
      return Outcome::misplaced;
    default:
      return Outcome::failed;
  }
}

bool isForWantOfAllowance(Outcome outcome) {
  return outcome == Outcome::inHiddenFolder || outcome == Outcome::onOtherFileSystem ||
         outcome == Outcome::packaged || outcome == Outcome::hardLinked;
}

}  // namespace

Removal::Removal(Ports ports, const Report& report, const Selection& selection,
                 Allowances allowances, const std::atomic<bool>& shouldStop)
    : ports_(ports),
      report_(report),
      selection_(selection),
      allowances_(allowances),
      shouldStop_(shouldStop) {}

const ReportGroup& Removal::groupOf(const RemovalStep& step) const {
  return report_.groups[selection_[step.choice].group];
}

const ReportFile& Removal::fileOf(const RemovalStep& step) const {
  return groupOf(step).files[step.file];
}

const std::string& Removal::pathOf(const RemovalStep& step) const {
  const ReportFile& file = fileOf(step);
  return step.name == 0 ? file.path : file.names[step.name - 1];
}

const std::string& Removal::keptFor(const RemovalStep& step) const {
  return groupOf(step).files[selection_[step.choice].kept].path;
}

std::uint64_t Removal::sizeOf(const RemovalStep& step) const {
  return groupOf(step).size;
}

// Where numbers do not last, another one tells nothing; the bytes do, right before the move.
bool Removal::isAsReported(const FileState& state, const ReportFile& file,
                           std::uint64_t size) const {
  if (state.size != size || state.modified != file.modified ||
      state.nanoseconds != file.nanoseconds)
    return false;
  if (state.inode == file.inode) return true;
  const auto folder = openFolderOf(file.path, ports_.fileSystem);
  return folder && !(*folder)->keepsNumbers();
}

std::optional<Problem> Removal::prepare() {
  if (const auto refusal = check(report_, selection_))
    return Problem{.reason = Problem::Reason::selection,
                   .description = "choice " + std::to_string(refusal->choice + 1)};
  steps_.clear();
  spaces_.clear();
  for (std::size_t choice = 0; choice < selection_.size(); ++choice) {
    const ReportGroup& group = report_.groups[selection_[choice].group];
    spaces_.emplace_back(group.files.size(), FileSpace{.bytes = group.size});
    for (const std::size_t victim : selection_[choice].victims) {
      const std::size_t names = allowances_.hardLinks ? group.files[victim].names.size() : 0;
      for (std::size_t name = 0; name <= names; ++name)
        steps_.push_back({.choice = choice, .file = victim, .name = name});
    }
  }
  Names packaged;
  if (!allowances_.packagedFiles) {
    Names names;
    for (const RemovalStep& step : steps_) names.insert(pathOf(step));
    auto owned = ports_.packagedFiles.among(names);
    if (!owned)
      return Problem{.reason = Problem::Reason::packages, .description = owned.error().message()};
    packaged = std::move(*owned);
  }
  std::size_t begin = 0;
  while (begin < steps_.size() && !shouldStop_) {
    std::size_t next = begin;
    while (next < steps_.size() && steps_[next].choice == steps_[begin].choice) ++next;
    lookAtGroup(begin, next, packaged);
    begin = next;
  }
  // Of what was not looked at nobody knows whether it would go.
  end(begin, steps_.size(), Outcome::stopped);
  return std::nullopt;
}

void Removal::lookAtGroup(std::size_t begin, std::size_t end, const Names& packaged) {
  const ReportGroup& group = groupOf(steps_[begin]);
  std::vector<std::uint64_t> devices;
  for (const ReportFile& file : group.files) {
    const auto place = placeOnDiskOf(file.path, ports_.disks);
    const auto state = ports_.trash.state(file.path);
    if (place && state && isAsReported(*state, file, group.size)) {
      spaces_[steps_[begin].choice][devices.size()] =
          spaceOf(file.path, group.size, ports_.fileSystem);
      devices.push_back(state->device);
      continue;
    }
    RemovalStep ending{.outcome = Outcome::changed};
    if (!place) {
      ending.outcome = Outcome::noAccess;
    } else if (!state && state.error().reason == TrashError::Reason::failed) {
      ending.outcome = Outcome::unreadable;
      ending.code = state.error().code;
    } else if (!state && state.error().reason == TrashError::Reason::noTrash) {
      ending.outcome = Outcome::noTrash;
    }
    for (std::size_t i = begin; i < end; ++i) {
      steps_[i].outcome = ending.outcome;
      steps_[i].code = ending.code;
    }
    return;
  }
  if (ports_.trash.isInTrash(keptFor(steps_[begin]))) {
    for (std::size_t i = begin; i < end; ++i) steps_[i].outcome = Outcome::inTrash;
    return;
  }
  const std::uint64_t keptDevice = devices[selection_[steps_[begin].choice].kept];
  for (std::size_t i = begin; i < end; ++i)
    lookAt(steps_[i], devices[steps_[i].file] == keptDevice, packaged);
}

void Removal::lookAt(RemovalStep& step, bool isOnFileSystemOfKept, const Names& packaged) {
  const std::string& path = pathOf(step);
  const std::size_t names = allowances_.hardLinks ? fileOf(step).names.size() + 1 : 1;
  const std::uint64_t links = linksTo(path);
  step.otherNames = links - std::min<std::uint64_t>(links, names);
  if (!allowances_.hiddenFolders && isInHiddenFolder(path, report_.roots)) {
    step.outcome = Outcome::inHiddenFolder;
  } else if (ports_.trash.isInTrash(path)) {
    step.outcome = Outcome::inTrash;
  } else if (!allowances_.otherFileSystems && !isOnFileSystemOfKept) {
    step.outcome = Outcome::onOtherFileSystem;
  } else if (packaged.contains(path)) {
    step.outcome = Outcome::packaged;
  } else if (!allowances_.hardLinks && links > 1) {
    step.outcome = Outcome::hardLinked;
  }
}

std::optional<Problem> Removal::begin() {
  if (auto problem = findTrashes()) return problem;
  const auto inJournal = [](const Varnel::Platform::PlatformError& error) {
    return Problem{.reason = Problem::Reason::journal, .description = error.localizedDescription()};
  };
  auto lock = ports_.journal.lock();
  if (!lock) return inJournal(lock.error());
  if (!*lock) return Problem{.reason = Problem::Reason::busy};
  lock_ = std::move(*lock);
  auto record = ports_.journal.begin(ports_.clock.now());
  if (!record) return inJournal(record.error());
  record_ = *record;
  return std::nullopt;
}

// All that lies in a folder has one trash.
std::optional<Problem> Removal::findTrashes() {
  Names asked;
  for (const RemovalStep& step : steps_) {
    if (step.outcome != Outcome::planned || !asked.insert(folderOf(pathOf(step))).second) continue;
    const auto place = placeOnDiskOf(pathOf(step), ports_.disks);
    const auto folder = ports_.trash.folderFor(pathOf(step));
    if (!folder && folder.error().reason == TrashError::Reason::noTrash)
      return Problem{.reason = Problem::Reason::noTrash,
                     .path = pathOf(step),
                     .description = folder.error().code ? folder.error().code.message() : ""};
  }
  return std::nullopt;
}

const RemovalStep* Removal::next() {
  if (shouldStop_) end(nextStep_, steps_.size(), Outcome::stopped);
  while (nextStep_ < steps_.size() && steps_[nextStep_].outcome != Outcome::planned) ++nextStep_;
  if (nextStep_ == steps_.size()) return nullptr;
  RemovalStep& step = steps_[nextStep_++];
  move(step);
  // Without a journal no other step is better, and a group that has changed is another group.
  if (step.outcome == Outcome::notJournalled) {
    end(nextStep_, steps_.size(), step.outcome);
  } else if (step.outcome == Outcome::changed || step.outcome == Outcome::different) {
    const auto isOther = [&](const RemovalStep& each) { return each.choice != step.choice; };
    const auto last = std::find_if(steps_.begin() + static_cast<std::ptrdiff_t>(nextStep_),
                                   steps_.end(), isOther);
    end(nextStep_, static_cast<std::size_t>(last - steps_.begin()), Outcome::changed);
  }
  return &step;
}

void Removal::end(std::size_t from, std::size_t to, Outcome outcome) {
  for (; from < to; ++from)
    if (steps_[from].outcome == Outcome::planned) steps_[from].outcome = outcome;
}

void Removal::move(RemovalStep& step) {
  const std::string& path = pathOf(step);
  const std::string& kept = keptFor(step);
  const ReportFile& keptFile = groupOf(step).files[selection_[step.choice].kept];
  Trash& trash = ports_.trash;
  const auto state = trash.state(path);
  const auto keptState = trash.state(kept);
  if (!state || !keptState || !isAsReported(*state, fileOf(step), sizeOf(step)) ||
      !isAsReported(*keptState, keptFile, sizeOf(step))) {
    step.outcome = Outcome::changed;
    return;
  }
  const Comparison comparison = compare({.path = kept, .status = statusOf(*keptState)},
                                        {.path = path, .status = statusOf(*state)},
                                        ports_.fileSystem, ports_.disks, shouldStop_);
  step.outcome = outcomeOf(comparison.verdict);
  step.code = comparison.code;
  if (step.outcome != Outcome::planned) return;

  const auto keptPlace = placeOnDiskOf(kept, ports_.disks);
  const auto place = placeOnDiskOf(path, ports_.disks);
  if (!keptPlace || !place) {
    step.outcome = Outcome::noAccess;
    return;
  }
  const ComparedFile compared{.path = kept, .status = statusOf(*keptState)};
  const auto staysAsCompared = [&] {
    const auto now = trash.state(kept);
    return now && *now == *keptState && isStillThere(compared, ports_.fileSystem);
  };
  bool isNoted = false, isKept = true;
  const auto moved = trash.move(path, *state, [&](const TrashedFile& planned) {
    isKept = staysAsCompared();
    isNoted = isKept && !ports_.journal.note(record_, planned);
    return isNoted;
  });
  if (!moved) {
    step.code = moved.error().code;
    step.outcome = outcomeOf(moved.error().reason, isKept);
    // What lies in the trash in its stead can be given back, too.
    if (step.outcome == Outcome::misplaced) {
      static_cast<void>(ports_.journal.note(record_, moved.error().file));
    } else if (isNoted) {
      static_cast<void>(ports_.journal.forget(record_, path));
    }
    return;
  }
  step.outcome = Outcome::moved;
  // Somebody else may have removed the other file in that very moment, for the sake of this one; or
  // both were one, seen through a file system that tells nothing of it.
  if (staysAsCompared() || trash.restore(*moved, Trash::Folders::leave)) return;
  step.outcome = Outcome::changed;
  static_cast<void>(ports_.journal.forget(record_, path));
}

RemovalTotals Removal::totals() const {
  RemovalTotals totals;
  for (std::size_t begin = 0, end = 0; begin < steps_.size(); begin = end) {
    for (end = begin; end < steps_.size() && steps_[end].choice == steps_[begin].choice; ++end) {
      const Outcome outcome = steps_[end].outcome;
      totals.planned += outcome == Outcome::planned;
      totals.moved += outcome == Outcome::moved;
      totals.notAllowed += isForWantOfAllowance(outcome);
    }
    totals.freedBytes += freedBytes(begin, end, {Outcome::moved});
    totals.plannedBytes += freedBytes(begin, end, {Outcome::moved, Outcome::planned});
  }
  totals.notMoved = steps_.size() - totals.planned - totals.moved - totals.notAllowed;
  return totals;
}

// A file goes with the last of its names.
std::uint64_t Removal::freedBytes(std::size_t begin, std::size_t end,
                                  const std::set<Outcome>& leaving) const {
  std::vector<FileSpace> files = spaces_[steps_[begin].choice];
  for (FileSpace& file : files) file.isHeld = true;
  for (std::size_t i = begin; i < end; ++i) {
    const RemovalStep& step = steps_[i];
    bool& isHeld = files[step.file].isHeld;
    isHeld = (step.name > 0 && isHeld) || step.otherNames > 0 || !leaving.contains(step.outcome);
  }
  FreedSpace space;
  for (const FileSpace& file : files) space.add(file);
  return space.sum();
}

}  // namespace Orvane
