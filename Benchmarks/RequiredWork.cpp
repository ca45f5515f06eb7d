// SPDX-License-Identifier: MIT
// The work that finding duplicates takes at the least, as a measure for those who do it with care:
//   RequiredWork FOLDER THREADS
// It walks, asks for the status of all files, reads the heads of files of equal size, and the rest
// of those with equal heads. Nobody rations it, it follows nothing that changes meanwhile, and it
// prints counts alone.
#include <dirent.h>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>
#include <xxhash.h>

#include <algorithm>
#include <array>
#include <atomic>
#include <condition_variable>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <memory>
#include <mutex>
#include <string>
#include <string_view>
#include <thread>
#include <tuple>
#include <vector>

namespace {

using Digest = std::array<std::uint64_t, 2>;

constexpr off_t headLength = 4096;
constexpr std::size_t blockLength = 256 * 1024;

struct File {
  off_t size;
  dev_t device;
  ino_t inode;
  std::string path;
  Digest digest{};
};
using Files = std::vector<File*>;

Digest digestFrom(XXH128_hash_t hash) {
  return {hash.high64, hash.low64};
}

/// Runs the work on so many threads.
template <typename Work>
void onThreads(unsigned count, const Work& work) {
  std::vector<std::jthread> threads;
  for (unsigned thread = 0; thread < count; ++thread)
    threads.emplace_back([&work, thread] { work(thread); });
}

/// The folders that are left to list. The lock guards all.
class Walk final {
 public:
  explicit Walk(std::string folder) : pending_{std::move(folder)} {}

  void run(std::vector<File>& files) {
    std::unique_lock lock(mutex_);
    for (;;) {
      changed_.wait(lock, [&] { return !pending_.empty() || busy_ == 0; });
      if (pending_.empty()) return changed_.notify_all();
      const std::string folder = std::move(pending_.back());
      pending_.pop_back();
      ++busy_;
      lock.unlock();
      std::vector<std::string> folders = list(folder, files);
      lock.lock();
      --busy_;
      std::move(folders.begin(), folders.end(), std::back_inserter(pending_));
      changed_.notify_all();
    }
  }

 private:
  static std::vector<std::string> list(const std::string& folder, std::vector<File>& files) {
    std::vector<std::string> folders;
    const std::unique_ptr<DIR, int (*)(DIR*)> stream(::opendir(folder.c_str()), ::closedir);
    while (const dirent* entry = stream ? ::readdir(stream.get()) : nullptr) {
      const std::string_view name = entry->d_name;
      if (name == "." || name == "..") continue;
      struct stat facts;
      if (entry->d_type == DT_DIR) {
        folders.push_back(folder + "/" + entry->d_name);
      } else if (entry->d_type == DT_REG &&
                 ::fstatat(::dirfd(stream.get()), entry->d_name, &facts, AT_SYMLINK_NOFOLLOW) ==
                     0 &&
                 facts.st_size > 0) {
        files.push_back({facts.st_size, facts.st_dev, facts.st_ino, folder + "/" + entry->d_name});
      }
    }
    return folders;
  }

  std::mutex mutex_;
  std::condition_variable changed_;
  std::vector<std::string> pending_;
  unsigned busy_ = 0;
};

void readHead(File& file, std::vector<char>& buffer) {
  const int descriptor = ::open(file.path.c_str(), O_RDONLY | O_CLOEXEC);
  if (descriptor < 0) return;
  const ssize_t count = ::pread(descriptor, buffer.data(), headLength, 0);
  file.digest =
      digestFrom(XXH3_128bits(buffer.data(), count > 0 ? static_cast<std::size_t>(count) : 0));
  ::close(descriptor);
}

void readAll(File& file, std::vector<char>& buffer) {
  if (file.size <= headLength) return;
  const int descriptor = ::open(file.path.c_str(), O_RDONLY | O_CLOEXEC);
  if (descriptor < 0) return;
  const std::unique_ptr<XXH3_state_t, XXH_errorcode (*)(XXH3_state_t*)> state(XXH3_createState(),
                                                                              XXH3_freeState);
  XXH3_128bits_reset(state.get());
  for (ssize_t count; (count = ::read(descriptor, buffer.data(), buffer.size())) > 0;)
    XXH3_128bits_update(state.get(), buffer.data(), static_cast<std::size_t>(count));
  file.digest = digestFrom(XXH3_128bits_digest(state.get()));
  ::close(descriptor);
}

template <typename Read>
void readEach(const Files& files, unsigned threads, const Read& read) {
  std::atomic<std::size_t> next = 0;
  onThreads(threads, [&](unsigned) {
    std::vector<char> buffer(blockLength);
    for (std::size_t index; (index = next++) < files.size();) read(*files[index], buffer);
  });
}

/// The files that agree with others in a key, sorted by it, and how many groups they make.
template <typename KeyOf>
std::pair<Files, std::size_t> sharing(Files files, const KeyOf& keyOf) {
  std::sort(files.begin(), files.end(),
            [&](const File* a, const File* b) { return keyOf(*a) < keyOf(*b); });
  Files shared;
  std::size_t groups = 0;
  for (auto begin = files.begin(); begin != files.end();) {
    const auto end = std::find_if(begin, files.end(),
                                  [&](const File* file) { return keyOf(*file) != keyOf(**begin); });
    if (end - begin > 1) {
      shared.insert(shared.end(), begin, end);
      ++groups;
    }
    begin = end;
  }
  return {std::move(shared), groups};
}

}  // namespace

int main(int count, char** arguments) {
  if (count != 3) return 2;
  const auto threads = static_cast<unsigned>(std::atoi(arguments[2]));
  Walk walk(arguments[1]);
  std::vector<std::vector<File>> parts(threads);
  onThreads(threads, [&](unsigned thread) { walk.run(parts[thread]); });

  Files all;
  for (std::vector<File>& part : parts)
    for (File& file : part) all.push_back(&file);
  const auto identityOf = [](const File& file) { return std::tie(file.device, file.inode); };
  std::sort(all.begin(), all.end(),
            [&](const File* a, const File* b) { return identityOf(*a) < identityOf(*b); });
  all.erase(
      std::unique(all.begin(), all.end(),
                  [&](const File* a, const File* b) { return identityOf(*a) == identityOf(*b); }),
      all.end());
  const std::size_t distinct = all.size();
  const auto sameSize = sharing(std::move(all), [](const File& file) { return file.size; }).first;
  readEach(sameSize, threads, readHead);
  const auto sizeAndDigest = [](const File& file) { return std::tie(file.size, file.digest); };
  const auto sameHead = sharing(sameSize, sizeAndDigest).first;
  readEach(sameHead, threads, readAll);
  std::printf("%zu files, %zu share a size, %zu a head too; %zu groups\n", distinct,
              sameSize.size(), sameHead.size(), sharing(sameHead, sizeAndDigest).second);
}
