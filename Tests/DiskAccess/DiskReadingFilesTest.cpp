// SPDX-License-Identifier: MIT
#include <condition_variable>
#include <random>

#include <Tests/DiskAccess/DiskReadingFixture.h>
#include <Tests/Support/Crew.h>

namespace Varnel {
namespace {

using namespace Tests;
using namespace std::chrono_literals;

/// What became of the files of a reading, by name.
class Results final {
 public:
  explicit Results(std::size_t count) : count_(count) {}

  DiskReadingQueue::DidEnd recorder() {
    return [this](const DiskReadingFile& file, DiskReadingResult result) {
      const std::lock_guard lock(mutex_);
      EXPECT_TRUE(results_.emplace(file.url.lastPathComponent(), result).second) << "told twice";
      changed_.notify_all();
    };
  }
  /// Waits until so many are told.
  std::map<std::string, DiskReadingResult> await(std::size_t count) {
    std::unique_lock lock(mutex_);
    changed_.wait(lock, [&] { return results_.size() >= count; });
    return results_;
  }
  std::map<std::string, DiskReadingResult> await() { return await(count_); }
  [[nodiscard]] bool isComplete() {
    const std::lock_guard lock(mutex_);
    return results_.size() == count_;
  }

 private:
  const std::size_t count_;
  std::mutex mutex_;
  std::condition_variable changed_;
  std::map<std::string, DiskReadingResult> results_;
};
using Told = std::map<std::string, DiskReadingResult>;

class DiskReadingFilesTest : public DiskReadingFixture {
 protected:
  static DiskReadingFile stickNamed(const std::string& name,
                                    std::optional<std::uint64_t> place = {}) {
    return {.url = URL::fileURLWithPath("/stick/" + name), .place = place};
  }
  static Next readAtOnce(const DiskReadingFile&, Turn&) { return Next::done(); }
  static Next neverRead(const DiskReadingFile&, Turn& turn) { return never(turn); }
};

TEST_F(DiskReadingFilesTest, ATurnCoversManySmallFilesAndPartOfALargeOne) {
  struct Call {
    std::string name;
    std::uint64_t before;
    auto operator<=>(const Call&) const = default;
  };
  std::vector<Call> calls;
  constexpr std::uint64_t mebibyte = 1 << 20;
  const auto file = [&](const char* name, std::uint64_t place, std::uint64_t size) {
    DiskReadingFile result = stickNamed(name, place);
    result.size = size * mebibyte;
    return result;
  };
  Results results(6);
  std::uint64_t left = 9;
  queue_->read(
      {file("f", 6, 3), file("a", 1, 1), file("large", 4, 9), file("b", 2, 1), file("c", 3, 1),
       file("e", 5, 2)},
      {},
      [&](const DiskReadingFile& read, Turn& turn) {
        calls.push_back({read.url.lastPathComponent(), turn.byteCount() / mebibyte});
        if (calls.back().name != "large") return Next::done();
        while (left > 0 && !turn.isOver()) {
          turn.didRead(mebibyte);
          --left;
        }
        return left > 0 ? Next::again() : Next::done();
      },
      results.recorder());
  for (const auto& [name, result] : results.await()) EXPECT_EQ(result, Result::read) << name;
  // The files of a disk that seeks are read on the way up; what is too large for the rest of a turn
  // begins the next.
  EXPECT_EQ(calls, (std::vector<Call>{{"a", 0},
                                      {"b", 1},
                                      {"c", 2},
                                      {"large", 0},
                                      {"large", 0},
                                      {"large", 0},
                                      {"e", 1},
                                      {"f", 0}}));
}

TEST_F(DiskReadingFilesTest, TellsOnceOfEachFileWhatBecameOfIt) {
  const URL forbidden = URL::fileURLWithPath("/stick/forbidden");
  scope_.forbid(forbidden);
  Results results(4);
  queue_->read(
      {stickNamed("a"),
       {.url = forbidden},
       {.url = homeFile},
       {.url = URL::fileURLWithPath("/nowhere/lost")}},
      {.propose = "test"},
      [&](const DiskReadingFile& file, Turn&) {
        EXPECT_EQ(scope_.openAccesses(file.url), 1);
        return Next::done();
      },
      results.recorder());
  EXPECT_EQ(results.await(), (Told{{"a", Result::read},
                                   {"forbidden", Result::notReadable},
                                   {"file", Result::read},
                                   {"lost", Result::unknownVolume}}));
  EXPECT_EQ(scope_.openAccesses(homeFile), 0);
}

TEST_F(DiskReadingFilesTest, EndsFilesThatNobodyHasBegun) {
  // The first file takes a turn, during which something happens.
  const auto readWhile = [&](DiskReadingOptions options, auto happens) {
    std::latch isIn(1);
    std::latch mayGo(1);
    Results results(3);
    queue_->read(
        {stickNamed("a"), stickNamed("b"), stickNamed("c")}, std::move(options),
        [&](const DiskReadingFile&, Turn&) {
          isIn.count_down();
          mayGo.wait();
          now_ = now_.load() + Turn::maxTime;
          return Next::done();
        },
        results.recorder());
    isIn.wait();
    happens(results);
    mayGo.count_down();
    return results.await();
  };
  std::stop_source source;
  EXPECT_EQ(readWhile({.stop = source.get_token()},
                      [&](Results& results) {
                        source.request_stop();
                        results.await(2);
                      }),
            (Told{{"a", Result::read}, {"b", Result::stopped}, {"c", Result::stopped}}));
  awaitFreeStick();
  EXPECT_EQ(readWhile({.accessWaitingTimeout = 0}, [](Results&) {}),
            (Told{{"a", Result::read}, {"b", Result::timedOut}, {"c", Result::timedOut}}));
  EXPECT_EQ(readWhile({}, [&](Results&) { unmount(stickVolume); }),
            (Told{{"a", Result::read}, {"b", Result::vanished}, {"c", Result::vanished}}));
}

TEST_F(DiskReadingFilesTest, EndsFilesOfADiskThatIsTaken) {
  const DiskAccessGuard session(begin(stickFile));
  for (const double timeout : {0.0, 0.001}) {
    Results results(2);
    queue_->read({stickNamed("a"), stickNamed("b")}, {.accessWaitingTimeout = timeout}, neverRead,
                 results.recorder());
    EXPECT_EQ(results.await(), (Told{{"a", Result::timedOut}, {"b", Result::timedOut}}));
  }
  Results results(2);
  queue_->read({stickNamed("a"), {.url = homeFile}}, {}, readAtOnce, results.recorder());
  EXPECT_EQ(results.await(1), (Told{{"file", Result::read}})) << "disks are read side by side";
  queue_.reset();
  EXPECT_EQ(results.await(), (Told{{"a", Result::stopped}, {"file", Result::read}}));
}

TEST_F(DiskReadingFilesTest, CallsBackOnTheExecutorAlone) {
  scope_.forbid(URL::fileURLWithPath("/stick/forbidden"));
  Results results(3);
  queue_->read(
      {stickNamed("a"), stickNamed("forbidden"), {.url = URL::fileURLWithPath("/lost")}},
      {.executor = mainExecutor_},
      [&](const DiskReadingFile&, Turn&) {
        EXPECT_TRUE(mainQueue_.isCurrent());
        return Next::done();
      },
      [&, record = results.recorder()](const auto& file, DiskReadingResult result) {
        EXPECT_TRUE(mainQueue_.isCurrent());
        record(file, result);
      });
  mainQueue_.runWhile([&] { return !results.isComplete(); });
}

/// A catalogue in which the look-ups of one file wait before they answer, as on a dead share.
class StuckCatalog final : public Platform::VolumeCatalog {
 public:
  StuckCatalog(Platform::VolumeCatalog& volumes, URL stuck)
      : volumes_(volumes), stuck_(std::move(stuck)) {}

  std::latch isAsked{1};
  std::latch mayAnswer{1};

  std::vector<Platform::MountedVolume> mountedVolumes() override {
    return volumes_.mountedVolumes();
  }
  std::vector<URL> pseudoFileSystems() override { return {}; }
  Platform::Result<std::optional<URL>> volumeURL(const URL& url) override {
    auto volume = volumes_.volumeURL(url);
    if (url == stuck_) {
      if (!wasAsked_.test_and_set()) isAsked.count_down();
      mayAnswer.wait();
    }
    return volume;
  }
  std::optional<std::string> volumeName(const URL&) override { return {}; }
  std::unique_ptr<Subscription> subscribe(ChangeHandler) override { return nullptr; }

 private:
  Platform::VolumeCatalog& volumes_;
  const URL stuck_;
  std::atomic_flag wasAsked_;
};

/// The same machine with a queue whose look-up of one file waits.
class StuckLookUpTest : public DiskReadingFilesTest {
 protected:
  /// Reads files, and returns when `stuck` among them is being looked up.
  void read(const URL& stuck, std::vector<DiskReadingFile> files, DiskReadingOptions options = {}) {
    catalog_.emplace(volumes_, stuck);
    stuckManager_.emplace(DiskAccessManager::Ports{devices_, disks_, *catalog_, scope_, center_});
    queue_.emplace(*stuckManager_, DiskReadingQueue::Ports{.readingPriority = priority_});
    results_.emplace(files.size());
    queue_->read(std::move(files), std::move(options), readAtOnce, results_->recorder());
    catalog_->isAsked.wait();
  }
  ~StuckLookUpTest() override { queue_.reset(); }

  std::optional<StuckCatalog> catalog_;
  std::optional<DiskAccessManager> stuckManager_;
  std::optional<Results> results_;
};

TEST_F(StuckLookUpTest, AnswersAStopMeanwhile) {
  std::stop_source source;
  read(homeFile, {{.url = homeFile}}, {.stop = source.get_token()});
  source.request_stop();
  EXPECT_EQ(results_->await(), (Told{{"file", Result::stopped}}));
  catalog_->mayAnswer.count_down();
}

TEST_F(StuckLookUpTest, LetsOthersPassHoweverManyAreStuck) {
  read(homeFile, {{.url = homeFile}});
  std::latch others(20);
  for (int i = 0; i < 20; ++i)
    queue_->read({{.url = homeFile}}, {}, readAtOnce,
                 [&](const auto&, DiskReadingResult) { others.count_down(); });
  Results results(1);
  queue_->read({{.url = stickFile}}, {}, readAtOnce, results.recorder());
  EXPECT_EQ(results.await(), (Told{{"file", Result::read}}));
  catalog_->mayAnswer.count_down();
  others.wait();
}

TEST_F(StuckLookUpTest, FindsAVolumeThatWasUnmountedMeanwhileVanished) {
  read(stickFile, {{.url = URL::fileURLWithPath("/home/a")}, {.url = stickFile}});
  EXPECT_EQ(results_->await(1), (Told{{"a", Result::read}})) << "no other file waits";
  unmount(stickVolume);
  catalog_->mayAnswer.count_down();
  EXPECT_EQ(results_->await(), (Told{{"a", Result::read}, {"file", Result::vanished}}));
}

// Readings of all classes with stops, time-outs and executors, while the stick comes and goes and
// the mode changes: no disk ever has too many readers, every file is told of once, and every place
// comes back.
TEST_F(DiskReadingFilesTest, LosesNothingUnderStress) {
  constexpr QoS classes[] = {QoS::background, QoS::utility, QoS::default_, QoS::userInteractive};
  std::atomic<int> inside = 0;
  std::atomic<bool> isOverrun = false;
  std::atomic<std::size_t> asked = 0;
  std::atomic<std::size_t> told = 0;
  std::atomic<int> askers = 4;
  Tests::Crew threads(4, [&](unsigned thread) {
    std::minstd_rand random(thread + 1);
    for (int i = 0; i < 300; ++i) {
      const unsigned choice = static_cast<unsigned>(random());
      std::stop_source source;
      DiskReadingOptions options{.qos = classes[thread], .stop = source.get_token()};
      if (choice % 3 == 0) options.accessWaitingTimeout = 1e-5 * (choice / 3 % 100);
      if (choice % 5 == 0) options.executor = Basalt::globalConcurrentQueue();
      std::vector<DiskReadingFile> files;
      for (unsigned file = 0; file < 1 + choice % 7; ++file)
        files.push_back(file % 3 == 2 ? stickNamed("a", random() % 100)
                                      : DiskReadingFile{.url = homeFile, .place = random() % 100});
      asked += files.size();
      queue_->read(
          files, options,
          [&, again = choice % 4 == 0](const DiskReadingFile& file, Turn& turn) {
            const bool isAtHome = file.url == homeFile;
            if (isAtHome && ++inside > 4) isOverrun = true;
            if (const DiskAccessGuard nested(again ? begin(file.url) : nullptr); nested)
              std::this_thread::yield();
            if (isAtHome) --inside;
            turn.didRead(Turn::maxBytes / 3);
            return again && turn.byteCount() < Turn::maxBytes ? Next::again() : Next::done();
          },
          [&](const DiskReadingFile&, DiskReadingResult) { ++told; });
      if (choice % 2 == 0) source.request_stop();
    }
    --askers;
  });
  for (bool isBackgroundMode = true; askers > 0; isBackgroundMode = !isBackgroundMode) {
    manager_->setIsBackgroundMode(isBackgroundMode);
    volumes_.unmount(stickVolume);
    mountStick();
  }
  manager_->setIsBackgroundMode(false);
  threads.join();
  while (told < asked) std::this_thread::yield();
  EXPECT_FALSE(isOverrun);
  queue_.reset();
  EXPECT_EQ(told, asked);
  while (accessesTo(homeVolume) > 0) std::this_thread::yield();
  awaitFreeStick();
}

}  // namespace
}  // namespace Varnel
