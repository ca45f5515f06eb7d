// SPDX-License-Identifier: MIT
// Counts the lines of files, never with more readers on a disk than it bears, and gives way to
// other programs. What takes the processor is done on worker threads, off the disk.
//   ReadInTurns FILE…
#include <algorithm>
#include <fstream>
#include <iostream>
#include <iterator>
#include <latch>
#include <string>
#include <vector>

#include <Varnel/Basalt/Executor.h>
#include <Varnel/DiskAccess/DiskReadingQueue.h>

using namespace Varnel;

int main(int count, char** arguments) {
  std::vector<DiskReadingFile> files;
  for (int i = 1; i < count; ++i)
    files.push_back({.url = Platform::URL::fileURLWithPath(arguments[i])});
  std::latch finished(count - 1);
  const auto workers = Basalt::globalConcurrentQueue();

  DiskReadingQueue::shared().read(
      std::move(files),
      {.propose = "counting lines", .qos = Platform::QualityOfService::background},
      [&](const DiskReadingFile& file, DiskReadingTurn& turn) {
        // Inside a place on the disk. A reader of large files asks whether its turn is over.
        const std::string path = file.url.path();
        std::ifstream stream(path, std::ios::binary);
        std::string bytes((std::istreambuf_iterator<char>(stream)), {});
        turn.didRead(bytes.size());
        workers->execute([&finished, path, bytes = std::move(bytes)] {
          const auto lines = std::count(bytes.begin(), bytes.end(), '\n');
          std::cout << (path + ": " + std::to_string(lines) + " lines\n") << std::flush;
          finished.count_down();
        });
        return DiskReadingNext::done();
      },
      [&](const DiskReadingFile& file, DiskReadingResult result) {
        if (result == DiskReadingResult::read) return;
        std::cerr << (file.url.path() + " was not read\n");
        finished.count_down();
      });
  finished.wait();
}
