// SPDX-License-Identifier: MIT
#pragma once

#include <atomic>
#include <functional>
#include <map>
#include <memory>
#include <string>
#include <utility>
#include <vector>

#include <Scan/ContentAccess.h>
#include <Scan/FileSystem.h>
#include <Scan/ScanObserver.h>

namespace Orvane::Testing {

/// Lets every reader in, or none, and knows whether the calling thread is inside.
class OpenAccess final : public ContentAccess {
 public:
  bool whileAccessing(const std::string&, std::uint64_t,
                      const std::function<void()>& read) override {
    if (refuses) return false;
    if (std::exchange(isInside(), true)) ++faults;
    read();
    isInside() = false;
    return true;
  }

  static bool& isInside() {
    thread_local bool inside = false;
    return inside;
  }

  bool refuses = false;
  std::atomic<int> faults{0};  ///< Nested accesses.
};

class LossRecorder final : public ScanObserver {
 public:
  void fileLeftOut(const std::string& path, const Loss& loss) override {
    files.emplace_back(path, loss.kind);
  }
  void folderLeftOut(const std::string& path, const Loss& loss) override {
    folders.emplace_back(path, loss.kind);
  }

  std::vector<std::pair<std::string, Loss::Kind>> files;
  std::vector<std::pair<std::string, Loss::Kind>> folders;
};

/// The real file system with faults: paths that cannot be listed, not to the end, or opened, files
/// that fail while they are read, and an action before each of these. Set up before the scan.
/// Counts content that is touched outside an access.
class FaultyFileSystem final : public FileSystem {
 public:
  FileResult<FolderListing> list(const std::string& folder) override {
    if (const auto fault = listFaults.find(folder); fault != listFaults.end())
      return std::make_error_code(fault->second);
    if (beforeList) beforeList(folder);
    auto listing = systemFileSystem().list(folder);
    if (const auto fault = interruptions.find(folder); listing && fault != interruptions.end())
      listing->interruption = std::make_error_code(fault->second);
    return listing;
  }

  FileResult<std::unique_ptr<OpenFile>> open(const std::string& path, ReadingPlan plan) override {
    if (!OpenAccess::isInside()) ++faults;
    if (const auto fault = openFaults.find(path); fault != openFaults.end())
      return std::make_error_code(fault->second);
    if (beforeOpen) beforeOpen(path);
    auto opened = systemFileSystem().open(path, plan);
    if (!opened) return opened;
    std::unique_ptr<OpenFile> file = std::make_unique<File>(*this, path, std::move(*opened));
    return file;
  }

  std::map<std::string, std::errc> listFaults;
  std::map<std::string, std::errc> interruptions;  ///< Of listings.
  std::map<std::string, std::errc> openFaults;
  std::map<std::string, std::errc> readFaults;
  std::function<void(const std::string& path)> beforeList;
  std::function<void(const std::string& path)> beforeOpen;
  std::function<void(const std::string& path)> beforeRead;
  std::atomic<int> faults{0};

 private:
  class File final : public OpenFile {
   public:
    File(FaultyFileSystem& owner, std::string path, std::unique_ptr<OpenFile> file)
        : owner_(owner), path_(std::move(path)), file_(std::move(file)) {}

    FileResult<std::size_t> read(std::span<std::byte> buffer) override {
      if (!OpenAccess::isInside()) ++owner_.faults;
      if (const auto fault = owner_.readFaults.find(path_); fault != owner_.readFaults.end())
        return std::make_error_code(fault->second);
      if (owner_.beforeRead) owner_.beforeRead(path_);
      return file_->read(buffer);
    }

    FileResult<FileStatus> status() override { return file_->status(); }

   private:
    FaultyFileSystem& owner_;
    std::string path_;
    std::unique_ptr<OpenFile> file_;
  };
};

}  // namespace Orvane::Testing
