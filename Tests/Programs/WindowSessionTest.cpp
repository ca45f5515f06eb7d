// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>
#include <sys/stat.h>

#include <deque>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <memory>
#include <set>
#include <string>
#include <utility>
#include <vector>

#include <Tests/Programs/ScanFolder.h>
#include <Varnel/Interface/MainMenuAccessibility.h>
#include <orvane-window/Model/Background.h>
#include <orvane-window/Model/Menu.h>
#include <orvane-window/Model/Session.h>

namespace Orvane {
namespace {

namespace fs = std::filesystem;
using Answer = DuplicateList::Answer;
using Event = Session::Event;
using Stage = Session::Stage;

ReportFile file(const std::string& path, std::int64_t modified = 0, bool isReference = false) {
  return {.path = path, .inode = 0, .modified = modified, .isReference = isReference};
}

/// Two groups, of 10 and of 3 bytes; the last file is a reference.
std::shared_ptr<const Report> twoGroups() {
  return std::make_shared<const Report>(
      Report{.groups = {{10, {file("/a", 3), file("/b", 1), file("/c", 2)}},
                        {3, {file("/d", 1), file("/kept/e", 2, true)}}}});
}

TEST(DuplicateList, NeverHasAWholeGroupNorAReferenceChosen) {
  DuplicateList list(twoGroups());
  EXPECT_EQ(list.duplicates(), (DuplicateList::Figures{3, 23}));
  const struct {
    DuplicateList::Place place;
    bool isChosen;
    Answer answer;
    DuplicateList::Figures chosen;
  } steps[] = {
      {{0, 0}, true, Answer::done, {1, 10}},        {{0, 2}, true, Answer::done, {2, 20}},
      {{0, 1}, true, Answer::lastOfGroup, {2, 20}}, {{1, 1}, true, Answer::reference, {2, 20}},
      {{0, 0}, true, Answer::done, {2, 20}},        {{0, 0}, false, Answer::done, {1, 10}},
      {{0, 1}, true, Answer::done, {2, 20}},        {{1, 0}, true, Answer::done, {3, 23}}};
  for (const auto& step : steps) {
    EXPECT_EQ(list.choose(step.place, step.isChosen), step.answer);
    EXPECT_EQ(list.chosen(), step.chosen);
  }
  const auto nothing = [](const std::string&) { return false; };
  const Selection byHand = list.selection(nothing);
  ASSERT_EQ(byHand.size(), 2u);
  EXPECT_EQ(byHand[0], (Choice{.group = 0, .kept = 0, .victims = {1, 2}}));
  EXPECT_EQ(byHand[1], (Choice{.group = 1, .kept = 1, .victims = {0}}));
  EXPECT_FALSE(check(*list.report(), byHand));

  // What lies in a trash stays for no other file, unless nothing else is left.
  list.choose({0, 1}, false);
  const auto isFirst = [](const std::string& path) { return path == "/a"; };
  EXPECT_EQ(list.selection(isFirst)[0], (Choice{.group = 0, .kept = 1, .victims = {2}}));
  list.choose({0, 1}, true);
  EXPECT_EQ(list.selection(isFirst)[0].kept, 0u);

  EXPECT_EQ(list.nextChosen({0, 2}), (DuplicateList::Place{1, 0}));
  EXPECT_EQ(list.nextChosen({1, 0}), (DuplicateList::Place{0, 1}));
  // A forged selection gets no further than a hand does.
  list.choose(Selection{{.group = 0, .kept = 0, .victims = {0, 1, 2}}});
  EXPECT_EQ(list.chosen(), (DuplicateList::Figures{2, 20}));
  list.choose(Selection{});
  EXPECT_EQ(list.nextChosen({1, 0}), (DuplicateList::Place{1, 0}));
}

/// Runs jobs when the test says so.
class StepBackground final : public Background {
 public:
  void start(Job job) override { jobs.push_back(std::move(job)); }
  /// Does the job; what it leads to comes with `deliver`.
  void work() {
    answers.push_back(jobs.front()());
    jobs.pop_front();
  }
  void deliver() {
    const auto answer = std::move(answers.front());
    answers.pop_front();
    answer();
  }
  void run() {
    work();
    deliver();
  }

  std::deque<Job> jobs;
  std::deque<Continuation> answers;
};

class FakeEngine final : public Engine {
 public:
  ScanOutcome scan(ScanRequest request, ScanControl& control) override {
    if (request.folders.front() == "/gone") return {.lostFolders = {{"/gone", {}}}};
    Report report = *twoGroups();
    if (request.minSize > 10) report.groups.clear();
    report.isPartial = control.isCancelled;
    return {.report = std::make_shared<const Report>(report),
            .jsonReport = [](const TextWriter& write) { return write("{}"); }};
  }
  bool isPassing(const std::string& path) const override { return trash.contains(path); }
  std::shared_ptr<PlannedRemoval> plan(std::shared_ptr<const Report> report, Selection selection,
                                       std::shared_ptr<MoveProgress>) override {
    planned = selection;
    return std::make_shared<Plan>(*this, std::move(report), std::move(selection));
  }
  MoveOutcome restore(MoveProgress&) override { return {.paths = std::exchange(trash, {})}; }

  Selection planned;
  std::set<std::string> trash;
  std::set<std::string> stubborn;  ///< What cannot be moved.

 private:
  class Plan final : public PlannedRemoval {
   public:
    Plan(FakeEngine& engine, std::shared_ptr<const Report> report, Selection selection)
        : engine_(engine), report_(std::move(report)), selection_(std::move(selection)) {}
    const std::string& problem() const override { return text_; }
    std::uint64_t files() const override { return 1; }
    std::uint64_t bytes() const override { return 1; }
    const std::set<std::string>& destinations() const override { return folders_; }
    std::vector<MoveOutcome::Left> left() const override { return {}; }
    MoveOutcome carryOut() override {
      MoveOutcome outcome;
      for (const Choice& choice : selection_)
        for (const std::size_t victim : choice.victims) {
          const std::string& path = report_->groups[choice.group].files[victim].path;
          if (engine_.stubborn.contains(path))
            outcome.left.push_back({path, "full"});
          else
            outcome.paths.insert(path);
        }
      engine_.trash = outcome.paths;
      return outcome;
    }

   private:
    FakeEngine& engine_;
    const std::shared_ptr<const Report> report_;
    const Selection selection_;
    const std::string text_;
    const std::set<std::string> folders_;
  };
};

struct SessionFixture : testing::Test {
  void scan() {
    session->addFolder("/f");
    session->scan();
    background.run();
  }
  std::vector<std::string> firstGroup() const {
    std::vector<std::string> paths;
    for (const ReportFile& each : session->list()->group(0).files) paths.push_back(each.path);
    return paths;
  }

  FakeEngine engine;
  StepBackground background;
  std::vector<Event> events;
  std::unique_ptr<Session> session = std::make_unique<Session>(
      Session::Ports{engine, background}, [this](Event event) { events.push_back(event); });
};

TEST_F(SessionFixture, ScansRemovesAndPutsBack) {
  session->scan();  // Of nothing.
  EXPECT_EQ(session->stage(), Stage::choosing);
  scan();
  session->choose(KeepRule::oldest);
  EXPECT_EQ(session->choose({0, 0}, false), Answer::done);  // Not while the rule is at work.
  background.run();
  EXPECT_EQ(session->list()->chosen().files, 3u);

  engine.stubborn = {"/c"};
  session->planRemoval();
  background.run();
  ASSERT_TRUE(session->plan());
  session->remove();
  EXPECT_EQ(session->stage(), Stage::removing);
  session->addFolder("/late");
  session->startOver();
  background.run();
  EXPECT_EQ(session->moved().paths, (std::set<std::string>{"/a", "/d"}));
  EXPECT_EQ(session->moved().left.size(), 1u);
  // A group of which one file is left is none.
  EXPECT_EQ(session->list()->report()->groups.size(), 1u);
  EXPECT_EQ(firstGroup(), (std::vector<std::string>{"/b", "/c"}));

  session->restore();
  background.run();
  EXPECT_EQ(session->list()->report()->groups.size(), 2u);
  EXPECT_EQ(firstGroup().size(), 3u);
  session->choose({0, 0}, true);
  session->restore();  // Nothing is left, and what is chosen stays so.
  background.run();
  EXPECT_EQ(session->list()->chosen().files, 1u);
  session->startOver();
  EXPECT_EQ(session->folders(), (std::vector<std::string>{"/f"}));
}

TEST_F(SessionFixture, AScanThatIsStoppedHasWhatItFoundAndOneThatFailsNothing) {
  session->addFolder("/f");
  session->addFolder("/f");
  EXPECT_EQ(session->folders().size(), 1u);
  for (const std::uint64_t minSize : {0u, 100u}) {
    session->scan({.minSize = minSize});
    session->stop();
    EXPECT_TRUE(session->isStopping());
    background.run();
    EXPECT_EQ(events.back(), minSize == 0 ? Event::scanned : Event::scanStopped);
    EXPECT_EQ(session->list() && session->list()->report()->isPartial, minSize == 0);
  }
  engine.trash = {"/a"};  // Of the result before, which is shown no more.
  session->restore();
  background.run();
  EXPECT_EQ(session->stage(), Stage::choosing);

  session->removeFolder("/f");
  session->addFolder("/gone");
  session->scan();
  background.run();
  EXPECT_EQ(events.back(), Event::scanFailed);
  EXPECT_EQ(session->stage(), Stage::choosing);
}

TEST_F(SessionFixture, StoppedWhileItLooksChoosesAndAsksNothing) {
  scan();
  session->choose({0, 0}, true);
  session->choose(KeepRule::oldest);
  session->stop();
  background.run();
  EXPECT_EQ(session->list()->chosen().files, 1u);
  session->addFolder("/next");  // Nothing that is chosen is lost by that.
  EXPECT_EQ(session->folders().size(), 2u);
  session->planRemoval();
  session->stop();
  background.run();
  EXPECT_FALSE(session->plan());
  session->remove();
  EXPECT_EQ(session->stage(), Stage::results);
}

TEST_F(SessionFixture, NeitherARuleNorAPlanKeepsWhatLiesInATrash) {
  engine.trash = {"/b"};
  scan();
  session->choose(KeepRule::oldest);  // That is "/b".
  background.run();
  EXPECT_FALSE(session->list()->isChosen({0, 2}));
  session->choose({0, 1}, false);
  session->choose({0, 0}, true);
  session->planRemoval();
  background.run();
  EXPECT_EQ(engine.planned[0], (Choice{.group = 0, .kept = 2, .victims = {0}}));
}

TEST_F(SessionFixture, ExportsItsReportAndTheChosenFilesOrLeavesWhatIsThere) {
  scan();
  const Testing::ScanFolder folder;
  folder.write("all.part", "somebody else's");
  folder.write("taken/full", "");
  fs::permissions(folder.write("private", "before"),
                  fs::perms::owner_read | fs::perms::owner_write);
  fs::create_symlink("private", folder.path("all"));
  ASSERT_EQ(::mkfifo(folder.path("pipe").c_str(), 0600), 0);
  const auto textOf = [&](const char* name) {
    std::ifstream file(folder.path(name));
    return std::string(std::istreambuf_iterator<char>(file), {});
  };
  const auto exportTo = [&](const char* name, Session::ExportKind kind) {
    session->exportTo(folder.path(name), kind);
    background.run();
    EXPECT_EQ(session->stage(), Stage::results);
    return session->exportFailure();
  };
  EXPECT_FALSE(exportTo("all", Session::ExportKind::scanReport));
  EXPECT_EQ(textOf("private"), "{}");
  EXPECT_EQ(fs::status(folder.path("private")).permissions(), fs::perms(0600));
  session->choose({0, 0}, true);
  session->choose({0, 1}, true);
  EXPECT_FALSE(exportTo("chosen", Session::ExportKind::chosenFiles));
  EXPECT_EQ(textOf("chosen"), "/a\n/b\n");
  for (const char* name : {"taken", "pipe", "taken/full/file"})
    EXPECT_TRUE(exportTo(name, Session::ExportKind::chosenFiles)) << name;
  const TextSource broken = [](const TextWriter& write) { return write("half") && false; };
  EXPECT_EQ(writeFile(folder.path("chosen"), broken), std::errc::io_error);
  EXPECT_EQ(textOf("chosen"), "/a\n/b\n");
  EXPECT_EQ(textOf("all.part"), "somebody else's");
  EXPECT_EQ(std::distance(fs::directory_iterator(folder.path()), {}), 6) << "something was left";

  const DuplicateList odd(std::make_shared<const Report>(
      Report{.groups = {{1, {file("/a\nb"), file("/\xff"), file("/plain")}}}}));
  std::string text;
  for (DuplicateList list = odd; const std::size_t place : {0u, 1u}) {
    list.choose({0, place}, true);
    text.clear();
    EXPECT_TRUE(writeChosenFiles(list, [&](std::string_view part) { return text += part, true; }));
  }
  EXPECT_EQ(text, "file:///a%0Ab\nfile:///%FF\n");
}

TEST_F(SessionFixture, EndsWhileWorkGoesOn) {
  session->addFolder("/f");
  session->scan();
  background.work();
  session.reset();
  background.deliver();
  EXPECT_EQ(events.back(), Event::started);
}

TEST(MainMenu, HasWhatTheBuildHas) {
  const auto everything = mainMenu({.features = Varnel::UserFeatures(-1), .isDebugMode = true});
  const auto known = Varnel::MainMenuAccessibility::instance().identifiers();
  const std::set<std::string> catalogue(known.begin(), known.end());
  std::set<std::string> identifiers;
  std::set<std::string> accelerators;
  for (const MenuGroup& group : everything)
    for (const MenuEntry& entry : group.entries) {
      EXPECT_TRUE(catalogue.contains(entry.identifier)) << entry.identifier;
      EXPECT_TRUE(identifiers.insert(entry.identifier).second) << entry.identifier;
      EXPECT_TRUE(entry.accelerator.empty() || accelerators.insert(entry.accelerator).second)
          << entry.accelerator;
    }
  std::set<std::string> plain;
  for (const MenuGroup& group : mainMenu({}))
    for (const MenuEntry& entry : group.entries) plain.insert(entry.identifier);
  for (const char* optional : {"main-menu.orvane.tell-a-friend", "main-menu.help.more-products",
                               "main-menu.help.rate-on-mas", "main-menu.debug.crash-me"}) {
    EXPECT_TRUE(identifiers.contains(optional)) << optional;
    EXPECT_FALSE(plain.contains(optional)) << optional;
  }
}

}  // namespace
}  // namespace Orvane
