// SPDX-License-Identifier: MIT
// A spinning disk for a loop device to stand on, as a file system of two files:
//   ModelledDisk STORE FOLDER [TRACE]
// FOLDER/disk holds what the file STORE holds, and takes as long as a head would. FOLDER/account
// tells the disk's seconds, seeks and bytes. A number that is written to it begins a new account,
// and says how many times faster than the model the disk is from then on; 0: it does not sleep.
// TRACE gets a line for each request (where, how long, microseconds) and an empty one for each new
// account.
//
// The requests come one at a time, so nothing here is shared. The file bypasses the page cache:
// what the kernel reads ahead and keeps, it does above, as on any disk.
#define FUSE_USE_VERSION 31
#include <fcntl.h>
#include <fuse.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <chrono>
#include <cmath>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <string>
#include <string_view>
#include <thread>

namespace {

using Clock = std::chrono::steady_clock;
using Seconds = std::chrono::duration<double>;

constexpr std::string_view diskName = "/disk";
constexpr std::string_view accountName = "/account";

/// One head over one platter that turns 7,200 times a minute.
struct Model {
  static constexpr double bytesPerSecond = 150e6;
  static constexpr double turn = 60.0 / 7200;
  static constexpr double neighbours = bytesPerSecond * turn;  ///< The bytes of a track.

  /// To move the head, and to wait until the place comes by: half a turn, on average.
  static double seekTime(double distance, double size) {
    const double move = distance < neighbours ? 0.3e-3 : 1e-3 + 11e-3 * std::sqrt(distance / size);
    return move + turn / 2;
  }
};

struct Account {
  double seconds = 0;
  std::uint64_t seeks = 0;
  std::uint64_t bytes = 0;
};

struct Disk {
  int store = -1;
  off_t size = 0;
  std::FILE* trace = nullptr;
  off_t head = 0;
  double speed = 0;
  Account account;

  void passTime(Clock::time_point begin, off_t offset, std::size_t length) {
    double cost = static_cast<double>(length) / Model::bytesPerSecond;
    if (offset != head) {
      cost +=
          Model::seekTime(std::abs(static_cast<double>(offset - head)), static_cast<double>(size));
      ++account.seeks;
    }
    head = offset + static_cast<off_t>(length);
    account.seconds += cost;
    account.bytes += length;
    if (trace)
      std::fprintf(trace, "%lld %zu %.0f\n", static_cast<long long>(offset), length, cost * 1e6);
    if (speed > 0)
      std::this_thread::sleep_until(
          begin + std::chrono::duration_cast<Clock::duration>(Seconds(cost / speed)));
  }
};

Disk& disk() {
  return *static_cast<Disk*>(fuse_get_context()->private_data);
}

int getAttributes(const char* path, struct stat* status, fuse_file_info*) {
  const bool isDisk = path == diskName;
  if (!isDisk && path != accountName) {
    *status = {};
    status->st_mode = S_IFDIR | 0700;
    return path == std::string_view("/") ? 0 : -ENOENT;
  }
  *status = {};
  status->st_mode = S_IFREG | 0600;
  status->st_nlink = 1;
  status->st_size = isDisk ? disk().size : 0;
  return 0;
}

int openFile(const char*, fuse_file_info* file) {
  file->direct_io = 1;
  return 0;
}

int readAccount(char* buffer, std::size_t length, off_t offset) {
  const Account& account = disk().account;
  const std::string text = std::to_string(account.seconds) + " " + std::to_string(account.seeks) +
                           " " + std::to_string(account.bytes) + "\n";
  if (offset >= static_cast<off_t>(text.size())) return 0;
  return static_cast<int>(text.copy(buffer, length, static_cast<std::size_t>(offset)));
}

int readFile(const char* path, char* buffer, std::size_t length, off_t offset, fuse_file_info*) {
  if (path == accountName) return readAccount(buffer, length, offset);
  const auto begin = Clock::now();
  const ssize_t count = pread(disk().store, buffer, length, offset);
  if (count < 0) return -errno;
  disk().passTime(begin, offset, static_cast<std::size_t>(count));
  return static_cast<int>(count);
}

int writeFile(const char* path, const char* buffer, std::size_t length, off_t offset,
              fuse_file_info*) {
  if (path == accountName) {
    disk().account = {};
    disk().speed = std::atof(std::string(buffer, length).c_str());
    if (disk().trace) std::fputc('\n', disk().trace);
    return static_cast<int>(length);
  }
  const auto begin = Clock::now();
  const ssize_t count = pwrite(disk().store, buffer, length, offset);
  if (count < 0) return -errno;
  disk().passTime(begin, offset, static_cast<std::size_t>(count));
  return static_cast<int>(count);
}

/// The shell truncates the account before it writes to it.
int truncateFile(const char* path, off_t, fuse_file_info*) {
  return path == accountName ? 0 : -EPERM;
}

}  // namespace

int main(int argc, char** argv) {
  if (argc < 3) {
    std::fprintf(stderr, "usage: ModelledDisk STORE FOLDER [TRACE]\n");
    return 2;
  }
  Disk disk;
  struct stat status = {};
  disk.store = open(argv[1], O_RDWR | O_CLOEXEC);
  if (disk.store < 0 || fstat(disk.store, &status) != 0) {
    std::perror(argv[1]);
    return 1;
  }
  disk.size = status.st_size;
  if (argc > 3 && !(disk.trace = std::fopen(argv[3], "w"))) {
    std::perror(argv[3]);
    return 1;
  }

  fuse_operations operations = {};
  operations.getattr = getAttributes;
  operations.truncate = truncateFile;
  operations.open = openFile;
  operations.read = readFile;
  operations.write = writeFile;

  // In the foreground, on one thread.
  std::string arguments[] = {argv[0], "-f", "-s", argv[2]};
  char* pointers[4];
  std::transform(std::begin(arguments), std::end(arguments), pointers,
                 [](std::string& text) { return text.data(); });
  return fuse_main(4, pointers, &operations, &disk);
}
