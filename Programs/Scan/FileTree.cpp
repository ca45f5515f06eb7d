// SPDX-License-Identifier: MIT
#include <Scan/FileTree.h>

#include <algorithm>
#include <limits>
#include <stdexcept>
#include <utility>

namespace Orvane {
namespace {

std::uint32_t sumOf(std::int64_t moment) {
  return static_cast<std::uint32_t>(static_cast<std::uint64_t>(moment) * 0x9E37'79B9'7F4A'7C15 >>
                                    32);
}

template <typename Block>
Block& takeFrom(std::vector<Block*>& free, std::vector<std::unique_ptr<Block>>& all,
                std::size_t max) {
  if (!free.empty()) {
    Block& block = *free.back();
    free.pop_back();
    return block;
  }
  if (all.size() == max) throw std::length_error("more files than a scan can number");
  // Its content stays unwritten, and takes no memory, until it is used.
  all.emplace_back(new Block);
  return *all.back();
}

}  // namespace

FileTree::FileTree() = default;
FileTree::~FileTree() = default;

Folder& FileTree::addGiven(const std::string& path) {
  const std::lock_guard lock(mutex_);
  return add(nullptr, ways_.emplace_back(path == "/" ? "" : path).c_str(), {});
}

Folder& FileTree::addFolder(const Folder& parent, const char* name, FileIdentity identity) {
  const std::lock_guard lock(mutex_);
  return add(&parent, name, identity);
}

Folder& FileTree::addMounted(const Folder& parent, std::string way) {
  const std::lock_guard lock(mutex_);
  return add(&parent, ways_.emplace_back(std::move(way)).c_str(), {});
}

Folder& FileTree::add(const Folder* parent, const char* name, FileIdentity identity) {
  const auto number = static_cast<std::uint32_t>(folders_.size());
  Folder& folder = folders_.emplace_back(Folder{parent, name, identity, number});
  folder.isReference = parent && parent->isReference;
  return folder;
}

std::uint32_t FileTree::deviceNumber(std::uint64_t identifier, const ScanDisk& disk) {
  const std::lock_guard lock(mutex_);
  const auto known = std::find_if(devices_.begin(), devices_.end(), [&](const Device& device) {
    return device.identifier == identifier;
  });
  if (known == devices_.end()) {
    devices_.push_back({identifier, &disk});
    return static_cast<std::uint32_t>(devices_.size() - 1);
  }
  return static_cast<std::uint32_t>(known - devices_.begin());
}

const char* FileTree::nameOf(FileNumber number) const {
  const std::uint32_t place = file(number).name;
  return names_[place / bytesPerBlock]->bytes.data() + place % bytesPerBlock;
}

std::string FileTree::pathOf(FileNumber number) const {
  return pathBelow(folderOf(number), nameOf(number));
}

FileIdentity FileTree::identityOf(FileNumber number) const {
  const FileRecord& record = file(number);
  return {.device = devices_[record.device].identifier, .inode = record.inode};
}

std::array<std::uint64_t, 2> FileTree::locationOf(FileNumber number) const {
  const FileRecord& record = file(number);
  std::uint64_t disk = 0;  // The number of its first device.
  while (devices_[disk].disk != devices_[record.device].disk) ++disk;
  return {disk << 32 | record.device, record.inode};
}

bool FileTree::isUnchanged(FileNumber number, const FileStatus& status) const {
  const FileRecord& record = file(number);
  return status.size == record.size && status.identity == identityOf(number) &&
         sumOf(status.modifiedAt) == record.modifiedAt;
}

std::size_t FileTree::fileCount() const {
  std::size_t count = 0;
  for (const auto& block : blocks_) count += block->count;
  return count;
}

FileTree::Block& FileTree::takeBlock() {
  const std::lock_guard lock(mutex_);
  return takeFrom(freeBlocks_, blocks_, std::numeric_limits<FileNumber>::max() / filesPerBlock);
}

FileTree::NameBlock& FileTree::takeNameBlock() {
  const std::lock_guard lock(mutex_);
  const std::size_t before = names_.size();
  NameBlock& block =
      takeFrom(freeNames_, names_, std::numeric_limits<std::uint32_t>::max() / bytesPerBlock);
  if (names_.size() > before) block.number = static_cast<std::uint32_t>(before);
  return block;
}

FileTree::Writer::~Writer() {
  const std::lock_guard lock(tree_.mutex_);
  if (files_ && files_->count < filesPerBlock) tree_.freeBlocks_.push_back(files_);
  if (names_) tree_.freeNames_.push_back(names_);
}

const char* FileTree::Writer::add(std::string_view name) {
  // A block that another writer left may be too full as well.
  while (!names_ || bytesPerBlock - names_->used <= name.size()) names_ = &tree_.takeNameBlock();
  char* const begin = names_->bytes.data() + names_->used;
  *std::copy(name.begin(), name.end(), begin) = '\0';
  names_->used += name.size() + 1;
  return begin;
}

void FileTree::Writer::add(const Folder& folder, const char* name, const FileStatus& status,
                           std::uint32_t device) {
  const char* const kept = add(name);
  if (!files_ || files_->count == filesPerBlock) files_ = &tree_.takeBlock();
  const auto place =
      names_->number * bytesPerBlock + static_cast<std::size_t>(kept - names_->bytes.data());
  files_->files[files_->count++] = {.size = status.size,
                                    .inode = status.identity.inode,
                                    .name = static_cast<std::uint32_t>(place),
                                    .folder = folder.number,
                                    .device = device,
                                    .modifiedAt = sumOf(status.modifiedAt)};
}

std::string pathBelow(const Folder& folder, std::string_view name) {
  std::size_t size = name.size();
  for (const Folder* each = &folder; each != nullptr; each = each->parent)
    size += std::string_view(each->name).size() + 1;
  std::string path(size, '/');
  auto begin = std::copy_backward(name.begin(), name.end(), path.end());
  for (const Folder* each = &folder; each != nullptr; each = each->parent) {
    const std::string_view above = each->name;
    begin = std::copy_backward(above.begin(), above.end(), begin - 1);
  }
  return path;
}

std::string pathOf(const Folder& folder) {
  if (folder.parent) return pathBelow(*folder.parent, folder.name);
  return folder.name[0] == '\0' ? "/" : folder.name;
}

bool isOnTheWay(const FileIdentity& identity, const Folder& folder) {
  for (const Folder* each = &folder; each != nullptr; each = each->parent)
    if (each->identity == identity) return true;
  return false;
}

bool isUnseen(const Folder& folder) {
  return folder.parent && std::string_view(folder.name).find('/') != std::string_view::npos;
}

}  // namespace Orvane
