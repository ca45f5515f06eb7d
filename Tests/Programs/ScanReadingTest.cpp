// SPDX-License-Identifier: MIT
#include <fcntl.h>
#include <sys/mman.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <chrono>
#include <csignal>
#include <fstream>
#include <functional>
#include <map>

#include <Scan/Candidate.h>
#include <Tests/Programs/ScanFixture.h>

namespace Orvane::Testing {
namespace {

using ScanReading = ScanFixture;
using Reading = FaultyFileSystem::Reading;

TEST_F(ScanReading, LeavesOutFilesThatVanishOrChangeMeanwhile) {
  using Path = const std::string&;
  std::map<std::string, std::function<void(Path)>> beforeOpen, beforeRead;
  const auto write = [&](const char* name) { return folder.write(name, bytes(10'000, 'a')); };
  const ScanFolder elsewhere;
  const std::string first = write("1"), second = write("2");
  const std::string twin = elsewhere.write("twin", bytes(10'000, 'a'));
  int pipe = -1;
  std::string content = "for another reader";
  const auto makePipe = [](Path path) {
    fs::remove(path);
    ASSERT_EQ(::mkfifo(path.c_str(), 0600), 0);
  };
  beforeOpen[write("gone")] = [](Path path) { fs::remove(path); };
  beforeOpen[write("swapped")] = [&](Path path) {
    fs::last_write_time(twin, fs::last_write_time(path));
    fs::rename(twin, path);
  };
  beforeOpen[write("replaced")] = [&](Path path) {
    fs::remove(path);
    fs::create_symlink(first, path);
  };
  beforeOpen[write("foldered")] = [](Path path) {
    fs::remove(path);
    fs::create_directory(path);
  };
  beforeOpen[write("unwritten")] = makePipe;
  beforeOpen[write("piped")] = [&](Path path) {
    makePipe(path);
    pipe = ::open(path.c_str(), O_RDWR | O_NONBLOCK | O_CLOEXEC);
    ASSERT_EQ(::write(pipe, content.data(), content.size()), std::ssize(content));
  };
  beforeRead[write("grows")] = [](Path path) { std::ofstream(path, std::ios::app) << "more"; };
  beforeRead[write("shrinks")] = [](Path path) { fs::resize_file(path, 100); };
  beforeRead[write("touched")] = [](Path path) {
    fs::last_write_time(path, fs::file_time_type::clock::now() + std::chrono::hours(1));
  };
  const auto act = [](const auto& actions) {
    return [&](Path path) {
      if (const auto action = actions.find(path); action != actions.end()) action->second(path);
    };
  };
  fileSystem.beforeOpen = act(beforeOpen);
  fileSystem.beforeRead = act(beforeRead);
  const ScanResult result = scan();
  EXPECT_THAT(paths(result), ElementsAre(ElementsAre(first, second)));
  EXPECT_EQ(result.totals.vanishedFiles, 1u);
  EXPECT_EQ(result.totals.changedFiles, 8u);
  EXPECT_EQ(losses.files.size(), 9u);
  EXPECT_EQ(::read(pipe, content.data(), content.size()), std::ssize(content));
  ::close(pipe);
}

TEST_F(ScanReading, LosingAFileAtALaterLookLosesNoOther) {
  for (const int lost : {1, 2, 3}) {
    const ScanFolder three;
    std::vector<std::string> left;
    for (const char* name : {"1", "2", "3"})
      left.push_back(three.write(name, bytes(2 * headLength, 'a')));
    const std::string victim = three.path(std::to_string(lost));
    std::erase(left, victim);
    std::atomic<int> opened{0};
    fileSystem.beforeOpen = [&](const std::string& path) {
      if (path == victim && ++opened == 2) fs::remove(path);
    };
    losses.files.clear();
    EXPECT_THAT(paths(scan({three.path()})), ElementsAre(left));
    EXPECT_THAT(losses.files, ElementsAre(Pair(victim, Loss::Kind::vanished)));
  }
}

std::atomic<int> leased{-1};

TEST_F(ScanReading, WaitsForALeaseToBeGivenBack) {
  const std::string first = folder.write("1", "same");
  const std::string second = folder.write("2", "same");
  leased = ::open(second.c_str(), O_RDWR | O_CLOEXEC);
  struct sigaction giveBack {
  }, before{};
  giveBack.sa_handler = [](int) { ::fcntl(leased, F_SETLEASE, F_UNLCK); };
  ::sigaction(SIGIO, &giveBack, &before);
  const bool hasLeases = ::fcntl(leased, F_SETLEASE, F_WRLCK) == 0;
  EXPECT_THAT(paths(scan()), ElementsAre(ElementsAre(first, second)));
  ::sigaction(SIGIO, &before, nullptr);
  ::close(leased);
  if (!hasLeases) GTEST_SKIP() << "the file system of temporary files grants no leases";
}

/// How many pages of the file are in the system's cache.
long cachedPages(const std::string& path) {
  const int file = ::open(path.c_str(), O_RDONLY | O_CLOEXEC);
  const std::size_t size = fs::file_size(path);
  std::vector<unsigned char> pages((size + 4095) / 4096);
  void* const mapped = ::mmap(nullptr, size, PROT_READ, MAP_SHARED, file, 0);
  EXPECT_EQ(::mincore(mapped, size, pages.data()), 0);
  ::munmap(mapped, size);
  ::close(file);
  return std::count_if(pages.begin(), pages.end(), [](auto page) { return page & 1; });
}

TEST_F(ScanReading, LeavesThePageCacheAloneWhereItShould) {
  const std::string equal[] = {folder.write("1", bytes(1'000'000, 'a')),
                               folder.write("2", bytes(1'000'000, 'a'))};
  // Of these the scan reads the heads alone, and the system reads ahead.
  std::vector<std::string> files = {folder.write("3", "a" + bytes(60'000, 'a')),
                                    folder.write("4", "b" + bytes(60'000, 'a'))};
  files.insert(files.end(), std::begin(equal), std::end(equal));
  for (const std::string& path : files) {
    const int file = ::open(path.c_str(), O_RDONLY | O_CLOEXEC);
    ::fsync(file);
    ::posix_fadvise(file, 0, 0, POSIX_FADV_DONTNEED);
    ::close(file);
    if (cachedPages(path) > 0) GTEST_SKIP() << "their file system is a cache itself";
  }
  const auto scanAs = [&](CacheUse use) {
    const ScanResult result = DuplicateFinder({systemFileSystem(use), turns, losses})
                                  .find({.folders = {folder.path()}}, control);
    EXPECT_THAT(paths(result), ElementsAre(::testing::ElementsAreArray(equal)));
    long pages = 0;
    for (const std::string& path : files) pages += cachedPages(path);
    return pages;
  };
  EXPECT_EQ(scanAs(CacheUse::traceless), 0);
  EXPECT_GE(scanAs(CacheUse::normal), 2 * 200) << "of 490; the kernel may take some";
}

TEST_F(ScanReading, StopsWithinAFileWhenAskedTo) {
  for (int i = 0; i < 3; ++i) fs::resize_file(folder.write(std::to_string(i), ""), 1'000'000'000);
  std::atomic<int> blocks{0};
  fileSystem.beforeRead = [&](const std::string&) {
    // Each file's beginning, middle and end are read first.
    if (++blocks > 10) control.isCancelled = true;
  };
  EXPECT_THAT(paths(scan()), IsEmpty()) << "nobody has seen the rest";
  EXPECT_LE(blocks, 20);
}

TEST_F(ScanReading, ReadsADiskThatMustWorkByPlaceAndEverythingOnce) {
  constexpr std::size_t size = headLength + 1000;
  turns.disk = {.places = 1, .isOrdered = true};
  turns.stepsPerTurn = 1;
  for (const int place : {5, 1, 7, 3, 2, 6, 4}) {
    const std::string path =
        folder.write(std::to_string(place), bytes(size, place < 4 ? 'a' : 'b'));
    fileSystem.places[path] = static_cast<std::uint64_t>(place);
  }
  EXPECT_THAT(paths(scan()), ::testing::SizeIs(2));
  // The first file's head shows that the disk must work.
  const std::string first = fileSystem.readings.at(0).path;
  std::vector<Reading> expected{{first, 0, headLength}};
  for (const auto& [path, place] : fileSystem.places)
    if (path != first) expected.push_back({path, 0, size});
  expected.push_back({first, headLength, size - headLength});
  EXPECT_EQ(fileSystem.readings, expected);

  // Where places cannot be told, inodes stand for them, and the question is soon given up.
  fileSystem.places = {{"nowhere", 1}};
  fileSystem.readings.clear();
  fileSystem.placesAsked = 0;
  for (int i = 10; i < 30; ++i) folder.write(std::to_string(i), bytes(size, 'a'));
  EXPECT_THAT(paths(scan()), ::testing::SizeIs(2));
  EXPECT_EQ(fileSystem.readings.size(), 28u);
  EXPECT_EQ(fileSystem.placesAsked, 8 + 1) << "the first file's rest is a look of its own";
}

TEST_F(ScanReading, ReadsLargeFilesOfAnOrderedDiskOneByOneAndNoByteTwice) {
  turns.disk = {.places = 2, .isOrdered = true};
  std::vector<std::string> equal;
  for (const char* name : {"1", "2", "3"})
    equal.push_back(folder.write(name, bytes(12'000'000, 'a')));
  for (const unsigned steps : {7u, 1u}) {  // A disk that need not work, and one that must.
    turns.stepsPerTurn = steps;
    fileSystem.readings.clear();
    EXPECT_THAT(paths(scan()), ElementsAre(equal));
    std::uint64_t total = 0;
    for (const Reading& reading : fileSystem.readings) total += reading.length;
    EXPECT_EQ(total, 36'000'000u);
    std::erase_if(fileSystem.readings,
                  [](const Reading& reading) { return reading.length <= headLength; });
    for (std::size_t i = 1; i < fileSystem.readings.size(); ++i) {
      const Reading& reading = fileSystem.readings[i];
      EXPECT_TRUE(reading.offset == headLength || reading.path == fileSystem.readings[i - 1].path);
    }
  }
}

TEST_F(ScanReading, TellsLargeFilesApartByTheirMiddleOrEnd) {
  for (const std::size_t place : {5'000'000u, 9'999'999u}) {
    const ScanFolder large;
    for (const char letter : {'a', 'b', 'c'}) {
      std::string content(10'000'000, 'x');
      content[place] = letter;
      large.write(std::string(1, letter), content);
    }
    control.bytesRead = 0;
    EXPECT_THAT(paths(scan({large.path()})), IsEmpty());
    EXPECT_LE(control.bytesRead, 3 * (headLength + 3 * 4096));
  }
}

// A byte at either side of each border between two looks.
TEST_F(ScanReading, OverlooksNoByteOfALargeFile) {
  constexpr std::uint64_t size = worthSamples + 5000;
  constexpr std::uint64_t middle = (size / 2) & ~std::uint64_t{4095};
  constexpr std::uint64_t end = (size - 4096) & ~std::uint64_t{4095};
  const auto write = [&](std::uint64_t place) {
    const std::string path = folder.write(std::to_string(place), "");
    fs::resize_file(path, size);
    if (place < size) std::fstream(path).seekp(static_cast<std::streamoff>(place)).put('x');
    return path;
  };
  for (const std::uint64_t border : {std::uint64_t{headLength}, middle, middle + 4096, end, size}) {
    write(border - 1);
    if (border < size) write(border);
  }
  EXPECT_THAT(paths(scan()), IsEmpty());
  const std::string equal[] = {write(size), write(size + 1)};
  EXPECT_THAT(paths(scan()), ElementsAre(::testing::UnorderedElementsAreArray(equal)));
}

}  // namespace
}  // namespace Orvane::Testing
