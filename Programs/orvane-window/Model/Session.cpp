// SPDX-License-Identifier: MIT
#include <orvane-window/Model/Session.h>

#include <algorithm>
#include <utility>

#include <orvane-window/Model/Background.h>

namespace Orvane {
namespace {

/// Asks the file system of each file, which takes most of the time, unless the work is to stop.
IsPassing passingFilesOf(const Engine& engine, const MoveProgress& progress) {
  return [&](const std::string& path) { return !progress.shouldStop && engine.isPassing(path); };
}

}  // namespace

Session::Session(Ports ports, Observer observer) : ports_(ports), observer_(std::move(observer)) {}

Session::~Session() {
  scanControl_->isCancelled = true;
  moveProgress_->shouldStop = true;
}

bool Session::isStopping() const {
  return stage_ == Stage::scanning ? scanControl_->isCancelled.load()
                                   : isAtWork() && moveProgress_->shouldStop.load();
}

void Session::begin(Stage stage) {
  if (stage == Stage::scanning)
    scanControl_ = std::make_shared<ScanControl>();
  else if (stage != Stage::removing)  // That goes on with the progress of its plan.
    moveProgress_ = std::make_shared<MoveProgress>();
  stage_ = stage;
  observer_(Event::started);
}

void Session::end(Stage stage, Event event) {
  stage_ = stage;
  observer_(event);
}

void Session::addFolder(std::string path) {
  if (isAtWork() || std::count(folders_.begin(), folders_.end(), path) > 0) return;
  folders_.push_back(std::move(path));
  observer_(Event::foldersChanged);
}

void Session::removeFolder(const std::string& path) {
  if (stage_ == Stage::choosing && std::erase(folders_, path) > 0) observer_(Event::foldersChanged);
}

void Session::scan(ScanRequest request) {
  if (isAtWork() || folders_.empty()) return;
  plan_.reset();
  request.folders = folders_;
  begin(Stage::scanning);
  ports_.background.start([this, &engine = ports_.engine, request = std::move(request),
                           control = scanControl_, lifetime = std::weak_ptr(lifetime_)] {
    auto outcome = std::make_shared<ScanOutcome>(engine.scan(request, *control));
    std::shared_ptr<DuplicateList> list;
    if (outcome->report) list = std::make_shared<DuplicateList>(outcome->report);
    return [this, outcome, list, control, lifetime] {
      if (lifetime.expired()) return;
      list_.reset();
      outcome_ = {};
      gone_.clear();
      if (control->isCancelled && (!list || list->report()->groups.empty()))
        return end(Stage::choosing, Event::scanStopped);
      outcome_ = std::move(*outcome);
      if (!list) return end(Stage::choosing, Event::scanFailed);
      list_ = list;
      end(Stage::results, Event::scanned);
    };
  });
}

void Session::stop() {
  if (stage_ == Stage::scanning)
    scanControl_->isCancelled = true;
  else if (isAtWork())
    moveProgress_->shouldStop = true;
}

void Session::startOver() {
  if (stage_ != Stage::results) return;
  list_.reset();
  plan_.reset();
  outcome_ = {};
  gone_.clear();
  end(Stage::choosing, Event::startedOver);
}

DuplicateList::Answer Session::choose(DuplicateList::Place place, bool isChosen) {
  if (stage_ != Stage::results) return DuplicateList::Answer::done;
  const auto answer = list_->choose(place, isChosen);
  observer_(Event::chosen);
  return answer;
}

void Session::choose(KeepRule rule) {
  if (stage_ != Stage::results) return;
  // A copy of the list is prepared behind the window: there may be a million files.
  begin(Stage::planning);
  ports_.background.start([this, rule, &engine = ports_.engine, report = list_->report(),
                           progress = moveProgress_, lifetime = std::weak_ptr(lifetime_)] {
    auto list = std::make_shared<DuplicateList>(report);
    list->choose(select(*report, rule, passingFilesOf(engine, *progress)));
    return [this, list, progress, lifetime] {
      if (lifetime.expired()) return;
      // Who shows it keeps it. One that was stopped may have a file in a trash stay for others.
      if (!progress->shouldStop) *list_ = std::move(*list);
      end(Stage::results, Event::chosen);
    };
  });
}

void Session::chooseNothing() {
  if (stage_ != Stage::results) return;
  list_->choose(Selection{});
  observer_(Event::chosen);
}

void Session::planRemoval() {
  if (stage_ != Stage::results || list_->chosen().files == 0) return;
  begin(Stage::planning);
  ports_.background.start([this, &engine = ports_.engine, list = *list_, progress = moveProgress_,
                           lifetime = std::weak_ptr(lifetime_)] {
    auto plan =
        engine.plan(list.report(), list.selection(passingFilesOf(engine, *progress)), progress);
    return [this, plan, progress, lifetime] {
      if (lifetime.expired()) return;
      plan_ = progress->shouldStop ? nullptr : plan;
      end(Stage::results, Event::planned);
    };
  });
}

void Session::forgetPlan() {
  if (stage_ == Stage::results) plan_.reset();
}

void Session::remove() {
  if (stage_ != Stage::results || !plan_) return;
  begin(Stage::removing);
  ports_.background.start([this, plan = std::exchange(plan_, {}), report = list_->report(),
                           lifetime = std::weak_ptr(lifetime_)] {
    auto outcome = std::make_shared<MoveOutcome>(plan->carryOut());
    auto rest = std::make_shared<const Report>(reportWithout(*report, outcome->paths));
    return [this, outcome, rest, lifetime] {
      if (lifetime.expired()) return;
      moved_ = std::move(*outcome);
      gone_.insert(moved_.paths.begin(), moved_.paths.end());
      // What is chosen stays so where nothing has come of it.
      if (!moved_.paths.empty()) list_ = std::make_shared<DuplicateList>(rest);
      end(Stage::results, Event::removed);
    };
  });
}

void Session::restore() {
  if (isAtWork()) return;
  begin(Stage::restoring);
  ports_.background.start([this, &engine = ports_.engine, report = outcome_.report, gone = gone_,
                           progress = moveProgress_, lifetime = std::weak_ptr(lifetime_)] {
    auto outcome = std::make_shared<MoveOutcome>(engine.restore(*progress));
    auto left = std::make_shared<std::set<std::string>>(gone);
    for (const std::string& path : outcome->paths) left->erase(path);
    std::shared_ptr<const Report> rest;
    if (report) rest = std::make_shared<const Report>(reportWithout(*report, *left));
    return [this, outcome, left, rest, lifetime] {
      if (lifetime.expired()) return;
      moved_ = std::move(*outcome);
      gone_ = std::move(*left);
      if (rest && !moved_.paths.empty()) list_ = std::make_shared<DuplicateList>(rest);
      end(rest ? Stage::results : Stage::choosing, Event::restored);
    };
  });
}

void Session::exportTo(std::string path, ExportKind kind) {
  if (stage_ != Stage::results) return;
  begin(Stage::exporting);
  const auto list = std::make_shared<const DuplicateList>(*list_);
  const TextSource chosen = [list](const TextWriter& write) {
    return writeChosenFiles(*list, write);
  };
  ports_.background.start([this, path = std::move(path),
                           source = kind == ExportKind::chosenFiles ? chosen : outcome_.jsonReport,
                           lifetime = std::weak_ptr(lifetime_)] {
    const auto failure = writeFile(path, source);
    return [this, failure, lifetime] {
      if (lifetime.expired()) return;
      exportFailure_ = failure;
      end(Stage::results, Event::exported);
    };
  });
}

}  // namespace Orvane
