// SPDX-License-Identifier: MIT
#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/mman.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <ctime>
#include <string>
#include <thread>
#include <vector>

#include <Tests/Support/ForbiddenCalls.h>
#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Platform/Linux/Adapters.h>
#include <Varnel/Platform/Ports/ReadFile.h>
#include <Varnel/Platform/Ports/ReadingPriority.h>
#include <Varnel/Platform/Ports/TracelessReader.h>

namespace Varnel::Platform {
namespace {

constexpr std::size_t pageSize = 4096;
constexpr unsigned dropBehind = 0x80;  // of preadv2

/// A file of a number of pages, and a hole behind them, of which the test decides which are in the
/// system's cache.
class CachedFile final {
 public:
  explicit CachedFile(std::size_t pageCount, std::size_t holePages = 0) : pageCount_(pageCount) {
    const std::string path = folder_.write("file", std::string(pageCount * pageSize, 'x'));
    descriptor_ = ::open(path.c_str(), O_RDWR);
    ::fsync(descriptor_);
    const auto size = static_cast<off_t>((pageCount + holePages) * pageSize);
    EXPECT_EQ(::ftruncate(descriptor_, size), 0);
    ::posix_fadvise(descriptor_, 0, 0, POSIX_FADV_DONTNEED);
  }
  ~CachedFile() { ::close(descriptor_); }
  CachedFile(const CachedFile&) = delete;
  CachedFile& operator=(const CachedFile&) = delete;

  [[nodiscard]] int descriptor() const { return descriptor_; }

  void load(std::size_t page) const {
    ::posix_fadvise(descriptor_, 0, 0, POSIX_FADV_RANDOM);  // nothing ahead of it
    char byte = 0;
    EXPECT_EQ(::pread(descriptor_, &byte, 1, static_cast<off_t>(page * pageSize)), 1);
    ::posix_fadvise(descriptor_, 0, 0, POSIX_FADV_NORMAL);
  }

  /// Which pages are in the cache, a digit for each.
  [[nodiscard]] std::string pages() const { return pages(pageCount_); }
  [[nodiscard]] std::string pages(std::size_t count) const {
    void* mapped = ::mmap(nullptr, count * pageSize, PROT_READ, MAP_SHARED, descriptor_, 0);
    std::vector<unsigned char> present(count);
    EXPECT_EQ(::mincore(mapped, count * pageSize, present.data()), 0);
    ::munmap(mapped, count * pageSize);
    std::string result;
    for (const unsigned char page : present) result += (page & 1) ? '1' : '0';
    return result;
  }

 private:
  const Tests::TemporaryFolder folder_;
  const std::size_t pageCount_;
  int descriptor_ = -1;
};

std::size_t readAll(const CachedFile& file) {
  TracelessReader reader(file.descriptor());
  std::vector<std::byte> buffer(3 * pageSize);
  std::size_t size = 0;
  while (true) {
    const auto count = reader.read(buffer, size);
    if (!count || *count == 0) return size;
    size += *count;
  }
}

struct Kernel {
  std::vector<Tests::ForbiddenCall> lacks;
  std::ptrdiff_t maxLeft;  ///< Pages that were read ahead while the reader asked for them.
};

/// What differs in the cache after a cold, a warm and a mixed file were read; empty for nothing.
std::string traces(const Kernel& kernel) {
  constexpr std::size_t pageCount = 2000;
  const CachedFile cold(pageCount);
  const CachedFile warm(pageCount);
  const CachedFile mixed(pageCount);
  for (std::size_t page = 0; page < pageCount; ++page) warm.load(page);
  for (const std::size_t page : {0u, 7u, 8u, 1999u}) mixed.load(page);
  const std::string before = mixed.pages();
  Tests::onAKernelThatForbids(kernel.lacks, EOPNOTSUPP, [&] {
    for (const CachedFile* file : {&cold, &warm, &mixed})
      EXPECT_EQ(readAll(*file), pageCount * pageSize);
  });
  const std::string after = mixed.pages();
  const auto present = [](const std::string& pages) { return std::ranges::count(pages, '1'); };
  std::string result;
  if (present(warm.pages()) != pageCount) result += " fewer of the warm file";
  if (present(cold.pages()) > kernel.maxLeft) result += " pages of the cold file";
  if (present(after) - present(before) > kernel.maxLeft) result += " pages of the mixed file";
  for (std::size_t page = 0; page < pageCount; ++page)
    if (before[page] > after[page]) result += " not page " + std::to_string(page);
  return result;
}

TEST(TracelessReader, LeavesInTheCacheWhatWasThere) {
  if (CachedFile(1).pages() != "0")
    GTEST_SKIP() << "the file system of temporary files is a cache itself";
  for (const Kernel& kernel :
       {Kernel{{}, 0}, Kernel{{{SYS_preadv2, dropBehind}}, 256}, Kernel{{SYS_preadv2}, 0}}) {
    // A kernel may take any page at any time, and some do; the reader's own faults come each time.
    std::string found = traces(kernel);
    for (int again = 0; again < 9 && !found.empty(); ++again) found = traces(kernel);
    EXPECT_EQ(found, "") << kernel.lacks.size() << ", " << kernel.maxLeft;
  }
}

TEST(TracelessReader, LooksNotMuchFurtherThanItReads) {
  constexpr std::size_t readPages = 12'000;
  const CachedFile small(1, 2 * readPages);
  const CachedFile diskImage(1, std::size_t{1} << 29);
  if (diskImage.pages() != "0")
    GTEST_SKIP() << "the file system of temporary files is a cache itself";
  const auto processorTime = [](const CachedFile& file) {
    const std::clock_t before = std::clock();
    Tests::onAKernelThatForbids({{SYS_preadv2, dropBehind}}, EOPNOTSUPP, [&] {
      TracelessReader reader(file.descriptor());
      std::vector<std::byte> buffer(100 * pageSize);
      for (std::size_t page = 0; page < readPages; page += 100)
        EXPECT_TRUE(reader.read(buffer, page * pageSize));
    });
    return std::clock() - before;
  };
  EXPECT_LE(processorTime(diskImage), 10 * processorTime(small));
  EXPECT_LE(std::ranges::count(diskImage.pages(2 * readPages), '1'), 256);
}

TEST(TracelessReader, JustReadsWhereTheSystemDoesNotHelp) {
  const CachedFile file(3);
  for (const int refusal : {EOPNOTSUPP, ENOSYS, EPERM, EINVAL})
    Tests::onAKernelThatForbids({SYS_preadv2, SYS_mincore}, refusal,
                                [&] { EXPECT_EQ(readAll(file), 3 * pageSize) << refusal; });
  std::vector<std::byte> buffer(pageSize);
  EXPECT_EQ(TracelessReader(-1).read(buffer, 0).error(), std::errc::bad_file_descriptor);
}

TEST(ReadingPriority, KnowsTheClassesAndHabitsOfTheKernel) {
  constexpr int lowest = 2 << 13 | 7;
  constexpr int idle = 3 << 13;
  constexpr int realTime = 1 << 13 | 4;
  constexpr int unsetOnOldKernels = 4;
  const auto priority = Linux::makeReadingPriority();
  EXPECT_EQ(priority->lowered(0), lowest);
  EXPECT_EQ(priority->lowered(realTime), realTime) << "nobody else may take it up again";
  EXPECT_EQ(priority->lowered(idle), idle) << "no less than it was";
  std::thread([&] {
    priority->set(lowest);
    priority->set(unsetOnOldKernels);
    EXPECT_NE(priority->current(), lowest);
  }).join();
  Tests::onAKernelThatForbids({SYS_ioprio_set, SYS_ioprio_get}, EPERM, [&] {
    priority->set(lowest);
    EXPECT_FALSE(priority->current());
  });
  EXPECT_NE(priority->current(), lowest);
}

TEST(ReadFile, GivesAllBytesOrTheReason) {
  const Tests::TemporaryFolder folder;
  const std::string bytes = std::string(200'000, 'a') + std::string("\0\xFF\n", 3);
  const std::string file = folder.write("file", bytes);
  EXPECT_EQ(*readFile(file), bytes);
  EXPECT_EQ(*readFile(file, bytes.size()), bytes);
  EXPECT_EQ(readFile(file, bytes.size() - 1).error(), std::errc::file_too_large);
  EXPECT_EQ(*readFile(folder.write("empty", ""), 0), "");
  EXPECT_FALSE(readFile("/proc/self/stat")->empty());

  EXPECT_EQ(readFile(folder.path() / "missing").error(), std::errc::no_such_file_or_directory);
  EXPECT_EQ(readFile(file + "/in a file").error(), std::errc::not_a_directory);
  const std::string pipe = folder.path() / "pipe";
  ASSERT_EQ(::mkfifo(pipe.c_str(), 0600), 0);
  for (const std::string& path :
       {pipe, folder.path().string(), std::string("/dev/zero"), file + '\0'})
    EXPECT_EQ(readFile(path).error(), std::errc::invalid_argument) << path;
}

}  // namespace
}  // namespace Varnel::Platform
