// SPDX-License-Identifier: MIT
#pragma once

#include <array>
#include <cstdint>
#include <deque>
#include <memory>
#include <mutex>
#include <string>
#include <string_view>
#include <vector>

#include <Scan/FileSystem.h>

namespace Orvane {

struct ScanDisk;

/// A folder of the tree. It knows its way up rather than its path, so that a deep tree takes no
/// more memory than a wide one.
struct Folder {
  const Folder* parent;   ///< Kept by the tree; null for a given folder.
  const char* name;       ///< Kept by the tree. For a given folder its path, empty for "/".
  FileIdentity identity;  ///< Until it is opened, what its parent tells of it.
  std::uint32_t number;   ///< In the tree.

  bool isWhole = false;  ///< Whether the tree has all that is directly in it; known once listed.
  bool isReference = false;    ///< Whether its files are to stay.
  bool leadsToMounts = false;  ///< Whether something is mounted below it.
  bool isListed = true;        ///< Not where it is given for some of its files alone.
};

/// Stands for a file of the tree.
using FileNumber = std::uint32_t;

/// A regular file under one of its names. There is one for every file of the tree, so it holds no
/// more than it must.
struct FileRecord {
  std::uint64_t size;
  std::uint64_t inode;
  std::uint32_t name;        ///< Its place among the names.
  std::uint32_t folder;      ///< Its folder's number.
  std::uint32_t device;      ///< Its device's number in the tree.
  std::uint32_t modifiedAt;  ///< A sum of the moment: other moments very likely have another.
};

/// The folders and files below some folders, in memory that does not move: records and names lie in
/// blocks, one after the other. While it grows, each thread writes through a `Writer` of its own.
/// Once it has grown, any thread may read it.
class FileTree final {
 public:
  class Writer;

  /// A file system in the tree, and the disk that it lies on.
  struct Device {
    std::uint64_t identifier;
    const ScanDisk* disk;
  };

  FileTree();
  ~FileTree();
  FileTree(const FileTree&) = delete;
  FileTree& operator=(const FileTree&) = delete;

  /// Adds a folder to scan. Any thread, as for the three below.
  Folder& addGiven(const std::string& path);
  /// Adds a folder whose name a writer keeps.
  Folder& addFolder(const Folder& parent, const char* name, FileIdentity identity);
  /// Adds what is mounted below a folder, by the names that lead down there.
  Folder& addMounted(const Folder& parent, std::string way);
  /// The number of the device, which is added with this disk if it is new.
  std::uint32_t deviceNumber(std::uint64_t identifier, const ScanDisk& disk);

  [[nodiscard]] const std::deque<Folder>& folders() const { return folders_; }
  [[nodiscard]] const std::vector<Device>& devices() const { return devices_; }
  [[nodiscard]] const FileRecord& file(FileNumber number) const {
    return blocks_[number / filesPerBlock]->files[number % filesPerBlock];
  }
  [[nodiscard]] const Folder& folderOf(FileNumber number) const {
    return folders_[file(number).folder];
  }
  [[nodiscard]] const char* nameOf(FileNumber number) const;
  [[nodiscard]] std::string pathOf(FileNumber number) const;
  [[nodiscard]] FileIdentity identityOf(FileNumber number) const;

  [[nodiscard]] const ScanDisk& diskOf(FileNumber number) const {
    return *devices_[file(number).device].disk;
  }
  /// The disk and the device, as one number, and the inode: files that likely lie together have
  /// locations that do.
  [[nodiscard]] std::array<std::uint64_t, 2> locationOf(FileNumber number) const;

  /// Whether the file that has this status now is still what the tree knows.
  [[nodiscard]] bool isUnchanged(FileNumber number, const FileStatus& status) const;

  [[nodiscard]] std::size_t fileCount() const;
  /// Above the number of every file.
  [[nodiscard]] std::size_t endOfNumbers() const { return blocks_.size() * filesPerBlock; }

  /// Calls `use(number, record)` for every file, in no order.
  template <typename Use>
  void forEachFile(const Use& use) const {
    for (std::size_t block = 0; block < blocks_.size(); ++block)
      for (std::uint32_t i = 0; i < blocks_[block]->count; ++i)
        use(static_cast<FileNumber>(block * filesPerBlock + i), blocks_[block]->files[i]);
  }

 private:
  static constexpr std::size_t filesPerBlock = 2048;
  struct Block {
    std::uint32_t count = 0;
    std::array<FileRecord, filesPerBlock> files;
  };
  /// Texts, each with its zero. A text's place is the number of its block and the offset there.
  static constexpr std::size_t bytesPerBlock = 1 << 16;
  struct NameBlock {
    std::uint32_t number = 0;
    std::size_t used = 0;
    std::array<char, bytesPerBlock> bytes;
  };

  Folder& add(const Folder* parent, const char* name, FileIdentity identity);
  Block& takeBlock();
  NameBlock& takeNameBlock();

  std::mutex mutex_;  ///< Guards the lists while the tree grows; not what writers write.
  std::deque<std::string> ways_;  ///< Paths of given folders, and the names down to mounted ones.
  std::deque<Folder> folders_;
  std::vector<Device> devices_;
  std::vector<std::unique_ptr<Block>> blocks_;
  std::vector<std::unique_ptr<NameBlock>> names_;
  std::vector<Block*> freeBlocks_;  ///< What writers left unfinished, for the next.
  std::vector<NameBlock*> freeNames_;
};

/// Adds files and names to a tree. One thread at a time.
class FileTree::Writer final {
 public:
  explicit Writer(FileTree& tree) : tree_(tree) {}
  ~Writer();
  Writer(const Writer&) = delete;
  Writer& operator=(const Writer&) = delete;

  /// The tree's copy of a name, which is shorter than 256 bytes.
  const char* add(std::string_view name);
  void add(const Folder& folder, const char* name, const FileStatus& status, std::uint32_t device);

 private:
  FileTree& tree_;
  Block* files_ = nullptr;
  NameBlock* names_ = nullptr;
};

/// The path of an entry in the folder, and the folder's own. Without recursion, however deep it
/// lies.
[[nodiscard]] std::string pathBelow(const Folder& folder, std::string_view name);
[[nodiscard]] std::string pathOf(const Folder& folder);

/// Whether it identifies the folder or one of those above it, up to a given one.
[[nodiscard]] bool isOnTheWay(const FileIdentity& identity, const Folder& folder);
/// Whether no listing shows the folder, as it is mounted in a pseudo file system. It may be a file.
[[nodiscard]] bool isUnseen(const Folder& folder);

}  // namespace Orvane
