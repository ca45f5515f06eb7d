// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <memory>
#include <set>
#include <string>
#include <system_error>
#include <vector>

#include <orvane-window/Model/DuplicateList.h>
#include <orvane-window/Model/Engine.h>

namespace Orvane {

class Background;

/// What the window is about: folders, a scan, its result, what is removed of it and put back.
///
///     Session session({engine, background}, [&](Session::Event event) { show(event); });
///     session.addFolder("/home/ann/Pictures");
///     session.scan();       // … Event::scanned
///     session.choose(KeepRule::oldest);
///     session.planRemoval();  // … Event::planned: ask the user
///     session.remove();       // … Event::removed
///
/// A call that makes no sense in the present stage does nothing. Main thread only; the work is done
/// behind it, and none of it is lost by ending the program.
class Session final {
 public:
  enum class Stage { choosing, scanning, results, planning, removing, restoring, exporting };
  enum class Event {
    foldersChanged,
    started,  ///< The stage tells what.
    scanned,
    scanFailed,   ///< `lostFolders` of the outcome tell why.
    scanStopped,  ///< Before anything was found.
    chosen,
    planned,
    removed,
    restored,
    exported,
    startedOver,
  };
  /// It may call the session.
  using Observer = std::function<void(Event)>;
  /// Both outlive the session; the background waits for its job before the engine goes.
  struct Ports {
    Engine& engine;
    Background& background;
  };

  Session(Ports ports, Observer observer);
  Session(const Session&) = delete;
  Session& operator=(const Session&) = delete;
  /// Asks a running work to stop.
  ~Session();

  [[nodiscard]] Stage stage() const { return stage_; }
  [[nodiscard]] bool isAtWork() const {
    return stage_ != Stage::choosing && stage_ != Stage::results;
  }
  [[nodiscard]] bool isStopping() const;

  /// In the order in which they were added; each once.
  [[nodiscard]] const std::vector<std::string>& folders() const { return folders_; }
  /// A result stays as it is: the folder is for the next scan.
  void addFolder(std::string path);
  void removeFolder(const std::string& path);

  /// From the folders, or again from the result; the request says what of them takes part. A scan
  /// that is stopped has what it found by then as its result.
  void scan(ScanRequest request = {});
  /// Ends whatever is being done, soon.
  void stop();
  /// Back to the folders.
  void startOver();

  [[nodiscard]] const ScanControl& scanControl() const { return *scanControl_; }
  [[nodiscard]] const MoveProgress& moveProgress() const { return *moveProgress_; }

  /// There is a list in all stages but `choosing` and `scanning`.
  /// A new one has another address; who shows it may keep the one before for a while.
  [[nodiscard]] std::shared_ptr<const DuplicateList> list() const { return list_; }
  [[nodiscard]] const ScanOutcome& outcome() const { return outcome_; }

  DuplicateList::Answer choose(DuplicateList::Place place, bool isChosen);
  void choose(KeepRule rule);
  void chooseNothing();

  void planRemoval();
  /// Of the last `planRemoval`; null when there is none to be asked about.
  [[nodiscard]] const PlannedRemoval* plan() const { return plan_.get(); }
  void remove();
  void forgetPlan();
  void restore();
  /// Of the last removal or restoration.
  [[nodiscard]] const MoveOutcome& moved() const { return moved_; }

  /// Writes to a file what the scan has found, as JSON, or which files are chosen.
  enum class ExportKind { scanReport, chosenFiles };
  void exportTo(std::string path, ExportKind kind);
  /// Why the last export has failed, if it has.
  [[nodiscard]] std::error_code exportFailure() const { return exportFailure_; }

 private:
  void begin(Stage stage);
  void end(Stage stage, Event event);

  const Ports ports_;
  const Observer observer_;
  Stage stage_ = Stage::choosing;
  std::vector<std::string> folders_;
  /// Shared with the work, which may outlive this.
  std::shared_ptr<ScanControl> scanControl_ = std::make_shared<ScanControl>();
  std::shared_ptr<MoveProgress> moveProgress_ = std::make_shared<MoveProgress>();
  ScanOutcome outcome_;
  std::shared_ptr<DuplicateList> list_;  ///< Of what is left of the outcome.
  std::set<std::string> gone_;           ///< What was removed of it and not put back.
  std::shared_ptr<PlannedRemoval> plan_;
  MoveOutcome moved_;
  std::error_code exportFailure_;
  const std::shared_ptr<bool> lifetime_ = std::make_shared<bool>();
};

}  // namespace Orvane
