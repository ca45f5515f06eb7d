// SPDX-License-Identifier: MIT
#include <Tests/Contract/ProcessWorlds.h>

#include <atomic>
#include <map>
#include <set>
#include <sstream>
#include <thread>

#include <Tests/Support/Crew.h>
#include <Varnel/Platform/Testing/CapturedOutput.h>
#include <Varnel/Platform/Testing/FakeProcessInfo.h>
#include <Varnel/Platform/Testing/FakeProcessLauncher.h>
#include <Varnel/Platform/Testing/FakeReadingPriority.h>
#include <Varnel/Platform/Testing/FakeSessionBoard.h>

namespace Varnel::Platform::Contract {
namespace {

using namespace std::string_literals;

TEST_P(ProcessInfoContract, KnowsItsSystemAndTellsAnEmptyVariableFromNone) {
  world->setEnvironment("VARNEL_A", "B=C");
  world->setEnvironment("VARNEL_EMPTY", "");
  const ProcessInfo& process = world->port();
  EXPECT_GT(process.operatingSystemVersion().major, 0);
  EXPECT_TRUE(process.executablePath().starts_with('/'));
  EXPECT_EQ(process.environmentVariable("VARNEL_A"), "B=C");
  EXPECT_EQ(process.environmentVariable("VARNEL_EMPTY"), "");
  for (const std::string& name : {"VARNEL_"s, "VARNEL_a"s, "VARNEL_A=B"s, "VARNEL_A\0"s, ""s})
    EXPECT_EQ(process.environmentVariable(name), std::nullopt) << name;
}

class FakeProcessInfoWorld final : public FakeColumn<ProcessInfoWorld, Testing::FakeProcessInfo> {
 public:
  void setEnvironment(const std::string& name, const std::string& value) override {
    port_.environment[name] = value;
  }
};
INSTANTIATE_TEST_SUITE_P(Fake, ProcessInfoContract, on<FakeProcessInfoWorld>());

TEST_P(ProcessLauncherContract, GivesAllThatAProgramHasPrintedOnce) {
  for (const std::string& text : {""s, "\0\xFF\n"s, std::string(60'000, 'x')}) {
    const auto [path, arguments] = world->thatPrints(text);
    const auto process = world->port().launch(path, arguments);
    ASSERT_TRUE(process);
    while ((*process)->isRunning()) std::this_thread::yield();
    (*process)->terminate();
    EXPECT_FALSE((*process)->isRunning());
    EXPECT_EQ((*process)->readOutput(), text);
    EXPECT_EQ((*process)->readOutput(), "");
  }
}

TEST_P(ProcessLauncherContract, EndsAProgramThatRuns) {
  const auto [path, arguments] = world->thatWaits();
  const auto process = world->port().launch(path, arguments);
  ASSERT_TRUE(process);
  for (int i = 0; i < 100; ++i) EXPECT_TRUE((*process)->isRunning());
  EXPECT_EQ((*process)->readOutput(), "");
  for (int i = 0; i < 2; ++i) {
    (*process)->terminate();
    EXPECT_FALSE((*process)->isRunning());
  }
  EXPECT_EQ((*process)->readOutput(), "");
  EXPECT_TRUE(world->port().launch(path, arguments)) << "and this one goes with its object";
}

TEST_P(ProcessLauncherContract, TellsWhyAProgramCannotBeLaunched) {
  const auto launch = [&](const std::string& path, const std::vector<std::string>& arguments) {
    return world->port().launch(path, arguments).error();
  };
  const auto [path, arguments] = world->thatPrints("text");
  EXPECT_EQ(launch(path + '\0', arguments), std::errc::invalid_argument);
  EXPECT_EQ(launch(path, {"-c\0"s}), std::errc::invalid_argument);
  const auto missing = world->thatDoesNotExist();
  EXPECT_EQ(launch(missing.path, {}), std::errc::no_such_file_or_directory);
}

class FakeProcessLauncherWorld final
    : public FakeColumn<ProcessLauncherWorld, Testing::FakeProcessLauncher> {
 public:
  Program thatPrints(const std::string& text) override {
    port_.script = {.output = text, .questions = 3};
    return {"/tool", {}};
  }
  Program thatWaits() override {
    port_.script = {.questions = -1};
    return {"/tool", {}};
  }
  Program thatDoesNotExist() override {
    port_.script.launchError = std::make_error_code(std::errc::no_such_file_or_directory);
    return {"/missing", {}};
  }
};
INSTANTIATE_TEST_SUITE_P(Fake, ProcessLauncherContract, on<FakeProcessLauncherWorld>());

TEST_P(ReadingPriorityContract, IsTheThreadsOwnAndCanBeRestored) {
  ReadingPriority& priority = world->port();
  const auto normal = priority.current();
  ASSERT_TRUE(normal);
  EXPECT_EQ(priority.ofMainThread(), normal);
  std::thread([&] {
    const auto lowered = priority.lowered(*normal);
    EXPECT_NE(lowered, *normal);
    EXPECT_EQ(priority.lowered(lowered), lowered);
    for (int i = 0; i < 2; ++i) {
      priority.set(lowered);
      EXPECT_EQ(priority.current(), lowered);
      EXPECT_EQ(priority.ofMainThread(), normal);
      priority.set(*normal);
      EXPECT_EQ(priority.current(), normal);
    }
    priority.set(lowered);
  }).join();
  EXPECT_EQ(priority.current(), normal);
  std::thread([&] { EXPECT_EQ(priority.current(), normal); }).join();
}

TEST_P(SessionBoardContract, GivesSoManyPlacesOfANameAndNobodyWaitsForEver) {
  using Wait = SessionBoard::Wait;
  SessionBoard& board = world->port();
  auto first = board.takePlace("disk/1", 2, Wait::no);
  const auto second = board.takePlace("disk/1", 2, Wait::forPlace);
  EXPECT_TRUE(first && second);
  EXPECT_FALSE(board.takePlace("disk/1", 2, Wait::no));
  EXPECT_TRUE(board.takePlace("disk/2", 1, Wait::no));
  first.reset();
  EXPECT_TRUE(board.takePlace("disk/1", 2, Wait::no));
  for (const unsigned count : {1u, 3u}) {
    std::atomic<unsigned> inside = 0;
    Tests::Crew crew(6, [&](unsigned) {
      for (int i = 0; i < 50; ++i) {
        const auto place = board.takePlace(std::to_string(count), count, Wait::forPlace);
        EXPECT_LE(++inside, count);
        std::this_thread::yield();
        --inside;
      }
    });
  }
}

TEST_P(SessionBoardContract, ShowsTheLastNoteOfEachProcessThatRuns) {
  SessionBoard& board = world->port();
  const auto texts = [&] {
    std::multiset<std::string> all;
    for (const auto& note : board.notes()) all.insert(note.text);
    return all;
  };
  using Texts = std::multiset<std::string>;
  EXPECT_EQ(texts(), Texts());
  EXPECT_FALSE(board.post("first"));
  EXPECT_FALSE(board.post("second"));
  world->postByAnother("another's");
  EXPECT_EQ(texts(), (Texts{"second", "another's"}));
  EXPECT_TRUE(board.post(std::string(SessionBoard::maxNoteSize + 1, ' ')));
  world->endAnother();
  EXPECT_EQ(texts(), Texts{"second"});
  board.withdraw();
  EXPECT_EQ(texts(), Texts());
}

class FakeSession final : public FakeColumn<SessionBoardWorld, Testing::FakeSessionBoard> {
 public:
  void postByAnother(const std::string& text) override { port_.setNotesOfOthers({{2, text}}); }
  void endAnother() override { port_.setNotesOfOthers({}); }
};
INSTANTIATE_TEST_SUITE_P(Fake, SessionBoardContract, on<FakeSession>());

INSTANTIATE_TEST_SUITE_P(Fake, ReadingPriorityContract, on<Testing::FakeReadingPriority>());

TEST_P(StandardOutputContract, PrintsTextsAsTheyAre) {
  std::string expected;
  for (const std::string& text : {"a"s, ""s, "100 %s\r\n"s, "\0\xFF"s, std::string(1 << 20, 'x')}) {
    world->port().print(text);
    expected += text;
  }
  EXPECT_TRUE(world->printed() == expected);
}

TEST_P(StandardOutputContract, NeverMixesTextsOfThreadsAndKeepsTheOrderOfEach) {
  constexpr int count = 1000;
  const auto print = [&](char name) {
    for (int i = 0; i < count; ++i)
      world->port().print(std::string(100, name) + ' ' + std::to_string(i) + '\n');
  };
  {
    std::jthread one(print, 'a');
    std::jthread other(print, 'b');
  }
  std::map<std::string, int> next;
  std::istringstream lines(world->printed());
  int number = 0;
  for (std::string name; lines >> name >> number;) EXPECT_EQ(number, next[name]++);
  EXPECT_EQ(next, (std::map<std::string, int>{{std::string(100, 'a'), count},
                                              {std::string(100, 'b'), count}}));
}

class FakeStandardOutputWorld final
    : public FakeColumn<StandardOutputWorld, Testing::CapturedOutput> {
 public:
  std::string printed() override { return port_.text(); }
};
INSTANTIATE_TEST_SUITE_P(Fake, StandardOutputContract, on<FakeStandardOutputWorld>());

TEST_P(SystemLogContract, WritesOneVisibleLineForEachText) {
  for (const std::string& text :
       {"100 %s ünïcode \\"s, ""s, "two\nlines\r"s, "a\0b"s, "\xFF"s, std::string(2000, 'x')})
    world->port().write(text);
  EXPECT_EQ(world->text(), "100 %s ünïcode \\\n\ntwo\\nlines\\r\na\\x00b\n\\xFF\n" +
                               std::string(2000, 'x') + "\n");
}

class FakeSystemLogWorld final : public FakeColumn<SystemLogWorld, Testing::CapturedSystemLog> {
 public:
  std::string text() override { return port_.text(); }
};
INSTANTIATE_TEST_SUITE_P(Fake, SystemLogContract, on<FakeSystemLogWorld>());

}  // namespace
}  // namespace Varnel::Platform::Contract
