// SPDX-License-Identifier: MIT
#pragma once

#include <atomic>
#include <condition_variable>
#include <functional>
#include <map>
#include <memory>
#include <mutex>
#include <string>
#include <thread>
#include <utility>
#include <vector>

#include <Scan/DiskTurns.h>
#include <Scan/FileSystem.h>
#include <Scan/ScanObserver.h>

namespace Orvane::Testing {

/// One disk for everything but what is mounted, whose turns are over after some steps, each task on
/// a thread of its own. Knows whose turn the calling thread has. Set up before the scan.
class FakeTurns final : public DiskTurns {
 public:
  ~FakeTurns() override { join(); }

  std::vector<ScanMount> mounts() override {
    std::vector<ScanMount> all = mounted;
    if (isAsked_.exchange(true))
      all.insert(all.end(), mountedMeanwhile.begin(), mountedMeanwhile.end());
    return all;
  }
  const ScanDisk& diskOf(const std::string& path) override {
    const auto other = mountedDisks.find(path);
    return other == mountedDisks.end() ? disk : other->second;
  }

  void start(const ScanDisk& at, std::shared_ptr<DiskTask> task) override {
    const std::lock_guard lock(mutex_);
    threads_.emplace_back([this, &at, task = std::move(task)] {
      current() = &at;
      if (refuses) return task->refuse();
      for (bool goesOn = true; goesOn;) {
        takePlace();
        Turn turn(stepsPerTurn);
        goesOn = task->run(turn).has_value();
        leavePlace();
      }
    });
  }

  /// Waits for the threads of the last scan.
  void join() {
    for (;;) {
      std::vector<std::thread> threads;
      {
        const std::lock_guard lock(mutex_);
        threads.swap(threads_);
      }
      if (threads.empty()) return;
      for (std::thread& thread : threads) thread.join();
    }
  }

  static bool& isInside() {
    thread_local bool inside = false;
    return inside;
  }

  /// The disk at which the calling thread's task reads.
  static const ScanDisk*& current() {
    thread_local const ScanDisk* disk = nullptr;
    return disk;
  }

  ScanDisk disk{.places = 4, .isOrdered = false};
  std::vector<ScanMount> mounted;
  std::vector<ScanMount> mountedMeanwhile;       ///< After the first look.
  std::map<std::string, ScanDisk> mountedDisks;  ///< Of some of them.
  unsigned stepsPerTurn = 1000;
  bool refuses = false;

 private:
  class Turn final : public DiskTurn {
   public:
    explicit Turn(unsigned steps) : steps_(steps) {}
    bool isOver() override { return --steps_ == 0; }
    void didRead(std::uint64_t) override {}

   private:
    unsigned steps_;
  };

  void takePlace() {
    std::unique_lock lock(mutex_);
    left_.wait(lock, [&] { return taken_ < disk.places; });
    ++taken_;
    isInside() = true;
  }

  void leavePlace() {
    isInside() = false;
    {
      const std::lock_guard lock(mutex_);
      --taken_;
    }
    left_.notify_one();
  }

  std::mutex mutex_;
  std::atomic<bool> isAsked_{false};
  std::condition_variable left_;
  std::vector<std::thread> threads_;
  unsigned taken_ = 0;
};

class LossRecorder final : public ScanObserver {
 public:
  void fileLeftOut(const std::string& path, const Loss& loss) override {
    files.emplace_back(path, loss.kind);
  }
  void folderLeftOut(const std::string& path, const Loss& loss) override {
    folders.emplace_back(path, loss.kind);
  }
  void networkEntered(const std::string& folder) override { networks.push_back(folder); }

  std::vector<std::pair<std::string, Loss::Kind>> files;
  std::vector<std::pair<std::string, Loss::Kind>> folders;
  std::vector<std::string> networks;
};

/// The real file system with faults: paths that cannot be opened or listed to the end, files that
/// fail while they are read, few descriptors, and an action before each of these. Set up before the
/// scan. Counts content that is touched outside a turn, and notes what is read.
class FaultyFileSystem final : public FileSystem {
 public:
  struct Reading {
    std::string path;
    std::uint64_t offset;
    std::size_t length;
    bool operator==(const Reading&) const = default;
  };

  FileResult<std::unique_ptr<OpenFolder>> openFolder(OpenFolder* base,
                                                     const std::string& path) override {
    auto* const above = static_cast<Folder*>(base);
    const std::string whole = above ? (above->path_ == "/" ? "" : above->path_) + "/" + path : path;
    if (const auto fault = folderFaults.find(whole); fault != folderFaults.end())
      return std::make_error_code(fault->second);
    if (openFolders >= maxOpenFolders) return std::make_error_code(std::errc::too_many_files_open);
    if (beforeOpenFolder) beforeOpenFolder(whole);
    auto opened = systemFileSystem().openFolder(above ? above->folder_.get() : nullptr, path);
    if (!opened) return opened;
    std::unique_ptr<OpenFolder> folder = std::make_unique<Folder>(*this, whole, std::move(*opened));
    return folder;
  }

  std::map<std::string, std::errc> folderFaults;
  std::map<std::string, std::errc> interruptions;  ///< Of listings.
  std::map<std::string, std::errc> openFaults;
  std::map<std::string, std::errc> readFaults;
  std::map<std::string, std::uint64_t> places;     ///< Where given, of all files.
  std::map<std::string, std::uint64_t> devices{};  ///< Where given, of files.
  std::map<std::string, SharedExtents> shared;     ///< Where given, of all files.
  std::function<void(const std::string& path)> beforeOpenFolder;
  std::function<void(const std::string& path)> beforeList;
  std::function<void(const std::string& path)> beforeOpen;
  std::function<void(const std::string& path)> beforeRead;
  using ShareResult = FileResult<std::optional<std::uint64_t>>;
  /// Where given, what the system answers to a wish to share.
  std::function<ShareResult(const std::string& source, const std::string& path,
                            std::uint64_t offset, std::uint64_t length)>
      share;
  std::map<std::string, FileIdentity> identities;  ///< Of folders that are mounted again.
  bool keepsNumbers = true;
  int maxOpenFolders = 1000;
  int maxFoldersBesideAFile = 1000;
  std::atomic<int> placesAsked{0};
  std::atomic<int> openFolders{0};
  std::atomic<int> faults{0};
  std::vector<Reading> readings;

 private:
  class File final : public OpenFile {
   public:
    File(FaultyFileSystem& owner, std::string path, std::unique_ptr<OpenFile> file)
        : owner_(owner), path_(std::move(path)), file_(std::move(file)) {}

    FileResult<std::size_t> read(std::uint64_t offset, std::span<std::byte> buffer) override {
      if (!FakeTurns::isInside()) ++owner_.faults;
      if (const auto fault = owner_.readFaults.find(path_); fault != owner_.readFaults.end())
        return std::make_error_code(fault->second);
      if (owner_.beforeRead) owner_.beforeRead(path_);
      {
        const std::lock_guard lock(owner_.mutex_);
        owner_.readings.push_back({path_, offset, buffer.size()});
      }
      return file_->read(offset, buffer);
    }

    FileResult<FileStatus> status() override {
      auto status = file_->status();
      if (status && owner_.devices.contains(path_))
        status->identity.device = owner_.devices.at(path_);
      return status;
    }

    std::optional<std::uint64_t> place() override {
      ++owner_.placesAsked;
      if (owner_.places.empty()) return file_->place();
      const auto place = owner_.places.find(path_);
      return place == owner_.places.end() ? std::nullopt : std::optional(place->second);
    }

    std::optional<SharedExtents> sharedExtents() override {
      if (owner_.shared.empty()) return file_->sharedExtents();
      const auto extents = owner_.shared.find(path_);
      return extents == owner_.shared.end() ? std::nullopt : std::optional(extents->second);
    }

    ShareResult share(OpenFile& source, std::uint64_t offset, std::uint64_t length) override {
      auto& from = static_cast<File&>(source);
      if (owner_.share) return owner_.share(from.path_, path_, offset, length);
      return file_->share(*from.file_, offset, length);
    }

   private:
    FaultyFileSystem& owner_;
    std::string path_;
    std::unique_ptr<OpenFile> file_;
  };

  class Folder final : public OpenFolder {
   public:
    Folder(FaultyFileSystem& owner, std::string path, std::unique_ptr<OpenFolder> folder)
        : owner_(owner), path_(std::move(path)), folder_(std::move(folder)) {
      ++owner_.openFolders;
    }
    ~Folder() override { --owner_.openFolders; }

    [[nodiscard]] FileIdentity identity() const override {
      const auto other = owner_.identities.find(path_);
      return other == owner_.identities.end() ? folder_->identity() : other->second;
    }

    FileResult<bool> list(const std::function<void(const FolderEntry&)>& visit) override {
      if (owner_.beforeList) owner_.beforeList(path_);
      const auto fault = owner_.interruptions.find(path_);
      if (fault != owner_.interruptions.end() && std::exchange(isListed_, true))
        return std::make_error_code(fault->second);
      return folder_->list(visit);
    }

    FolderEntry look(const char* name) override { return folder_->look(name); }

    [[nodiscard]] bool keepsNumbers() const override { return owner_.keepsNumbers; }

    [[nodiscard]] bool mayShareExtents() const override {
      return !owner_.shared.empty() || folder_->mayShareExtents();
    }

    FileResult<std::unique_ptr<OpenFile>> open(const char* name, ReadingPlan plan) override {
      const std::string path = path_ + "/" + name;
      if (!FakeTurns::isInside()) ++owner_.faults;
      if (const auto fault = owner_.openFaults.find(path); fault != owner_.openFaults.end())
        return std::make_error_code(fault->second);
      if (owner_.openFolders > owner_.maxFoldersBesideAFile)
        return std::make_error_code(std::errc::too_many_files_open);
      if (owner_.beforeOpen) owner_.beforeOpen(path);
      auto opened = folder_->open(name, plan);
      if (!opened) return opened;
      std::unique_ptr<OpenFile> file = std::make_unique<File>(owner_, path, std::move(*opened));
      return file;
    }

   private:
    friend FaultyFileSystem;
    FaultyFileSystem& owner_;
    std::string path_;
    std::unique_ptr<OpenFolder> folder_;
    bool isListed_ = false;
  };

  std::mutex mutex_;
};

}  // namespace Orvane::Testing
