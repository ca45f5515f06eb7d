// SPDX-License-Identifier: MIT
// Reads files of a spinning disk in the order in which they lie, for Benchmarks/spinning-disk:
//   ReadingOrder list FOLDER    prints the files that share a size: place, size and path of each
//   ReadingOrder read LIST HOW  reads those files to their end, each once
// HOW is "plain": one thread reads them all; or "sessions": each of eight threads has folders of
// its own, and reads their files in order, within a session for each.
#include <dirent.h>
#include <fcntl.h>
#include <linux/fiemap.h>
#include <linux/fs.h>
#include <sys/ioctl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <fstream>
#include <functional>
#include <latch>
#include <map>
#include <string>
#include <string_view>
#include <thread>
#include <tuple>
#include <vector>

#include <Varnel/DiskAccess/DiskAccessManager.h>
#include <Varnel/DiskAccess/DiskReadingQueue.h>
#include <Varnel/Platform/Concurrency/StartThread.h>

namespace {

struct File {
  std::uint64_t place;
  std::uint64_t size;
  std::string path;
};

using PathsByInode = std::multimap<std::uint64_t, std::string>;

[[noreturn]] void fail(const std::string& path) {
  std::perror(path.c_str());
  std::exit(1);
}

/// Adds what a folder holds.
void readFolder(const std::string& path, PathsByInode& folders, PathsByInode& files) {
  DIR* const folder = opendir(path.c_str());
  if (!folder) fail(path);
  while (const dirent* entry = readdir(folder)) {
    const std::string_view name = entry->d_name;
    if (name == "." || name == "..") continue;
    if (entry->d_type == DT_DIR) folders.emplace(entry->d_ino, path + "/" + entry->d_name);
    if (entry->d_type == DT_REG) files.emplace(entry->d_ino, path + "/" + entry->d_name);
  }
  closedir(folder);
}

/// The regular files below a folder. The folders are read as the head sweeps over their inodes.
PathsByInode filesBelow(const std::string& root) {
  PathsByInode folders;
  PathsByInode files;
  readFolder(root, folders, files);
  std::uint64_t head = 0;
  while (!folders.empty()) {
    auto next = folders.lower_bound(head);
    if (next == folders.end()) next = folders.begin();
    head = next->first;
    const std::string path = std::move(next->second);
    folders.erase(next);
    readFolder(path, folders, files);
  }
  return files;
}

/// Where the file begins on its disk.
std::uint64_t placeOf(const std::string& path) {
  const int descriptor = open(path.c_str(), O_RDONLY | O_CLOEXEC);
  if (descriptor < 0) fail(path);
  union {
    fiemap map;
    char bytes[sizeof(fiemap) + sizeof(fiemap_extent)];
  } request = {};
  request.map.fm_length = FIEMAP_MAX_OFFSET;
  request.map.fm_extent_count = 1;
  if (ioctl(descriptor, FS_IOC_FIEMAP, &request) != 0) fail(path);
  close(descriptor);
  return request.map.fm_mapped_extents > 0 ? request.map.fm_extents[0].fe_physical : 0;
}

void list(const std::string& root) {
  std::vector<File> files;
  std::map<std::uint64_t, int> countsBySize;
  for (auto& [inode, path] : filesBelow(root)) {
    struct stat status = {};
    if (lstat(path.c_str(), &status) != 0) fail(path);
    const auto size = static_cast<std::uint64_t>(status.st_size);
    if (size == 0) continue;
    ++countsBySize[size];
    files.push_back({0, size, std::move(path)});
  }
  std::erase_if(files, [&](const File& file) { return countsBySize[file.size] < 2; });
  for (File& file : files) file.place = placeOf(file.path);
  std::sort(files.begin(), files.end(), [](const File& a, const File& b) {
    return std::tie(a.place, a.path) < std::tie(b.place, b.path);
  });
  for (const File& file : files)
    std::printf("%llu %llu %s\n", static_cast<unsigned long long>(file.place),
                static_cast<unsigned long long>(file.size), file.path.c_str());
}

std::vector<File> listed(const char* path) {
  std::ifstream stream(path);
  std::vector<File> files;
  for (File file; stream >> file.place >> file.size && std::getline(stream >> std::ws, file.path);)
    files.push_back(file);
  return files;
}

void readWhole(const std::string& path, std::vector<char>& buffer) {
  const int descriptor = open(path.c_str(), O_RDONLY | O_CLOEXEC);
  if (descriptor < 0) fail(path);
  ssize_t count = 0;
  while ((count = read(descriptor, buffer.data(), buffer.size())) > 0) {
  }
  if (count < 0) fail(path);
  close(descriptor);
}

void readPlain(const std::vector<File>& files) {
  std::vector<char> buffer(512 * 1024);
  for (const File& file : files) readWhole(file.path, buffer);
}

void readWithinSessions(const std::vector<File>& files) {
  std::vector<char> buffer(512 * 1024);
  auto& manager = Varnel::DiskAccessManager::shared();
  for (const File& file : files) {
    const auto url = Varnel::Platform::URL::fileURLWithPath(file.path);
    const auto session = manager.beginAccessingURL(url, "Measure");
    if (!session) std::abort();
    readWhole(file.path, buffer);
    session->endAccessing();
  }
}

void readByQueue(const std::vector<File>& files) {
  std::vector<Varnel::DiskReadingFile> wanted;
  for (const File& file : files)
    wanted.push_back({.url = Varnel::Platform::URL::fileURLWithPath(file.path),
                      .place = file.place,
                      .size = file.size});
  std::latch ended(static_cast<std::ptrdiff_t>(wanted.size()));
  Varnel::DiskReadingQueue::shared().read(
      std::move(wanted), {.propose = "Measure"},
      [](const Varnel::DiskReadingFile& file, Varnel::DiskReadingTurn& turn) {
        thread_local std::vector<char> buffer(512 * 1024);
        readWhole(file.url.path(), buffer);  // None is larger than a turn.
        turn.didRead(*file.size);
        return Varnel::DiskReadingNext::done();
      },
      [&](const Varnel::DiskReadingFile&, Varnel::DiskReadingResult result) {
        if (result != Varnel::DiskReadingResult::read) std::abort();
        ended.count_down();
      });
  ended.wait();
}

/// The files of eight threads. Each has the files of some folders, in the order of the list.
std::vector<std::vector<File>> shares(const std::vector<File>& files) {
  std::vector<std::vector<File>> result(8);
  std::map<std::string, std::size_t> sharesByFolder;
  for (const File& file : files) {
    const std::string folder = file.path.substr(0, file.path.rfind('/'));
    const auto share = sharesByFolder.emplace(folder, sharesByFolder.size() % result.size()).first;
    result[share->second].push_back(file);
  }
  return result;
}

void readOnThreads(const std::vector<File>& files,
                   const std::function<void(const std::vector<File>&)>& readShare) {
  const auto lists = shares(files);
  std::vector<std::thread> threads;
  for (const auto& share : lists)
    threads.push_back(Varnel::Platform::startThread("reader", [&] { readShare(share); }));
  for (std::thread& thread : threads) thread.join();
}

}  // namespace

int main(int argc, char** argv) {
  const std::string_view verb = argc > 2 ? argv[1] : "";
  const std::string_view how = argc > 3 ? argv[3] : "";
  if (verb == "list") {
    list(argv[2]);
  } else if (verb == "read" && how == "plain") {
    readPlain(listed(argv[2]));
  } else if (verb == "read" && how == "sessions") {
    readOnThreads(listed(argv[2]), readWithinSessions);
  } else if (verb == "read" && how == "queue") {
    readOnThreads(listed(argv[2]), readByQueue);
  } else {
    std::fprintf(stderr, "usage: ReadingOrder list FOLDER | read LIST plain|sessions|queue\n");
    return 2;
  }
  return 0;
}
