// SPDX-License-Identifier: MIT
#include <orvane-window/Model/SystemEngine.h>

#include <chrono>
#include <filesystem>
#include <limits>
#include <utility>

#include <Removal/DpkgFiles.h>
#include <Removal/RemovalJournal.h>
#include <Scan/FileSystem.h>
#include <Scan/ScanRequest.h>
#include <Varnel/DiskAccess/DiskAccessManager.h>
#include <Varnel/Platform/Ports/Clock.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <orvane-window/Model/MoveReasons.h>
#include <orvane-window/Model/Texts.h>
#include <orvane/ScanAnalytics.h>
#include <orvane/ScanLog.h>
#include <orvane/ScanReport.h>
#include <orvane/Search.h>

namespace Orvane {
namespace {

using Varnel::Platform::processPorts;

/// The folders without links in their paths, as the scan wants them.
std::vector<std::string> resolved(const std::vector<std::string>& folders,
                                  std::vector<LostPath>& lost) {
  std::vector<std::string> paths;
  for (const std::string& folder : folders) {
    std::error_code error;
    const auto path = std::filesystem::canonical(folder, error);
    if (!error && !std::filesystem::is_directory(path, error) && !error)
      error = std::make_error_code(std::errc::not_a_directory);
    if (error)
      lost.push_back({folder, Loss::because(error)});
    else
      paths.push_back(path.string());
  }
  return paths;
}

std::unique_ptr<RemovalJournal> productJournal() {
  const auto& ports = processPorts();
  return std::make_unique<RemovalJournal>(
      Varnel::Platform::DurableFile::Ports{ports.privateFiles, ports.systemLog},
      RemovalJournal::productPath());
}

class SystemRemoval final : public PlannedRemoval {
 public:
  SystemRemoval(std::shared_ptr<const Report> report, Selection selection,
                std::shared_ptr<MoveProgress> progress)
      : report_(std::move(report)),
        selection_(std::move(selection)),
        progress_(std::move(progress)) {}

  void prepare() {
    const auto problem = removal_.prepare();
    if (problem) problem_ = textOf(*problem);
    if (!problem_.empty()) return;
    // One trash serves a file system; asking for each file would make a call for each.
    std::set<std::uint64_t> devices;
    for (const RemovalStep& step : removal_.steps()) {
      if (progress_->shouldStop) return;
      if (step.outcome != RemovalStep::Outcome::planned) continue;
      const std::string& path = removal_.pathOf(step);
      const auto state = processPorts().trash.get().state(path);
      if (!state || !devices.insert(state->device).second) continue;
      if (const auto folder = processPorts().trash.get().folderFor(path))
        destinations_.insert(*folder);
    }
  }

  const std::string& problem() const override { return problem_; }
  std::uint64_t files() const override { return removal_.totals().planned; }
  std::uint64_t bytes() const override { return removal_.totals().plannedBytes; }
  const std::set<std::string>& destinations() const override { return destinations_; }

  std::vector<MoveOutcome::Left> left() const override {
    std::vector<MoveOutcome::Left> left;
    for (const RemovalStep& step : removal_.steps())
      if (step.outcome != RemovalStep::Outcome::planned) addTo(left, step);
    return left;
  }

  MoveOutcome carryOut() override {
    MoveOutcome outcome;
    progress_->all = files();
    std::vector<const RemovalStep*> planned;
    for (const RemovalStep& step : removal_.steps())
      if (step.outcome == RemovalStep::Outcome::planned) planned.push_back(&step);
    if (const auto problem = removal_.begin()) {
      outcome.problem = textOf(*problem);
      return outcome;
    }
    while (removal_.next()) ++progress_->done;
    for (const RemovalStep* step : planned)  // One that fails may end others.
      if (step->outcome == RemovalStep::Outcome::moved)
        outcome.paths.insert(removal_.pathOf(*step));
      else
        addTo(outcome.left, *step);
    outcome.bytes = removal_.totals().freedBytes;
    return outcome;
  }

 private:
  void addTo(std::vector<MoveOutcome::Left>& left, const RemovalStep& step) const {
    // Whoever stopped it knows that.
    if (step.outcome != RemovalStep::Outcome::stopped)
      left.push_back({removal_.pathOf(step), textOf(step.outcome, step.code)});
  }

  const std::shared_ptr<const Report> report_;
  const Selection selection_;
  const std::shared_ptr<MoveProgress> progress_;
  DpkgFiles packagedFiles_;
  const std::unique_ptr<RemovalJournal> journal_ = productJournal();
  Removal removal_{{systemFileSystem(), Varnel::DiskAccessManager::shared(), processPorts().trash,
                    packagedFiles_, *journal_, processPorts().clock},
                   *report_,
                   selection_,
                   Allowances{},
                   progress_->shouldStop};
  std::string problem_;
  std::set<std::string> destinations_;
};

}  // namespace

SystemEngine::SystemEngine(Console& console, std::optional<std::string> analyticsEndpoint)
    : console_(console), analyticsEndpoint_(std::move(analyticsEndpoint)) {}

SystemEngine::~SystemEngine() = default;

bool SystemEngine::isPassing(const std::string& path) const {
  return processPorts().trash.get().isInTrash(path);
}

ScanOutcome SystemEngine::scan(ScanRequest request, ScanControl& control) {
  ScanOutcome outcome;
  request.folders = resolved(request.folders, outcome.lostFolders);
  if (!outcome.lostFolders.empty()) return outcome;
  const ScanFacts facts{
      .startedAt = std::chrono::floor<std::chrono::seconds>(processPorts().clock.get().now()),
      .folders = request.folders};

  analytics_ = std::make_unique<ScanAnalytics>(analyticsEndpoint_, false, console_);
  analytics_->scanStarted(request.folders.size());
  ScanLog log(console_);
  const SearchManner manner{.program = "orvane-window",
                            .qos = Varnel::Platform::QualityOfService::userInitiated,
                            .showsProgress = false};
  const auto result =
      std::make_shared<const ScanResult>(search(request, manner, log, console_, control));
  outcome.lostFolders = result->lostFolders;
  outcome.totals = result->totals;
  if (!outcome.lostFolders.empty()) return outcome;
  Report report = reportOf(*result);
  report.roots = request.folders;
  outcome.report = std::make_shared<const Report>(std::move(report));
  outcome.jsonReport = [result, facts](const TextWriter& write) {
    return writeReport(*result, facts, std::numeric_limits<std::size_t>::max(), write);
  };
  if (result->isPartial)
    analytics_->scanCancelled();
  else
    analytics_->scanFinished(result->groups.size());
  return outcome;
}

std::shared_ptr<PlannedRemoval> SystemEngine::plan(std::shared_ptr<const Report> report,
                                                   Selection selection,
                                                   std::shared_ptr<MoveProgress> progress) {
  auto removal =
      std::make_shared<SystemRemoval>(std::move(report), std::move(selection), std::move(progress));
  removal->prepare();
  return removal;
}

MoveOutcome SystemEngine::restore(MoveProgress& progress) {
  MoveOutcome outcome;
  const auto journal = productJournal();
  Restoration restoration({Varnel::DiskAccessManager::shared(), processPorts().trash, *journal},
                          std::nullopt);
  if (const auto problem = restoration.begin()) {
    outcome.problem = textOf(*problem);
    return outcome;
  }
  progress.all = restoration.steps().size();
  while (!progress.shouldStop) {
    const RestorationStep* step = restoration.next();
    if (!step) break;
    ++progress.done;
    using Outcome = RestorationStep::Outcome;
    const auto& file = step->entry.file;
    if (step->outcome == Outcome::restored || step->outcome == Outcome::inPlace) {
      outcome.paths.insert(file.path);
      outcome.bytes += file.state.size;
    } else {
      outcome.left.push_back({file.path, textOf(step->outcome, step->code)});
    }
  }
  return outcome;
}

}  // namespace Orvane
