// SPDX-License-Identifier: MIT
#include <Removal/Comparison.h>

#include <algorithm>
#include <memory>
#include <vector>

#include <Removal/DiskPlace.h>
#include <Removal/OpenedFile.h>
#include <Scan/Loss.h>

namespace Orvane {
namespace {

using Verdict = Comparison::Verdict;

constexpr std::size_t blockLength = std::size_t{1} << 20;
/// Then others come in, who read more urgently.
constexpr std::uint64_t maxTurn = 16 * blockLength;

Comparison because(std::error_code error) {
  const Loss loss = Loss::because(error);
  if (loss.kind != Loss::Kind::unreadable) return {.verdict = Verdict::changed, .code = error};
  return {.verdict = Verdict::unreadable, .code = error};
}

/// A file that is read from its beginning to its end.
class Reading final {
 public:
  explicit Reading(const ComparedFile& file) : file_(file), block_(blockLength) {}

  [[nodiscard]] Comparison open(FileSystem& fileSystem) {
    auto opened = openFile(file_.path, fileSystem);
    if (!opened) return because(opened.error());
    open_ = std::move(*opened);
    return checkState();
  }

  [[nodiscard]] Comparison checkState() {
    const auto status = open_->status();
    if (!status) return because(status.error());
    changedAt_ = status->changedAt;
    return {.verdict = status->hasContentOf(file_.status) ? Verdict::equal : Verdict::changed};
  }

  /// The next bytes: as many as there are, up to a block.
  [[nodiscard]] Comparison next() {
    length_ = 0;
    while (length_ < blockLength) {
      const auto count = open_->read(offset_, std::span(block_).subspan(length_));
      if (!count) return because(count.error());
      if (*count == 0) break;
      offset_ += *count;
      length_ += *count;
    }
    return {};
  }

  // File systems in layers show a file of another one under numbers of their own. What they leave
  // as it is, but for digits that a network drops, is the time that nobody can set.
  [[nodiscard]] bool isOfSameFile(const Reading& other) const {
    constexpr std::int64_t commonUnit = 100;
    const FileIdentity &mine = file_.status.identity, &others = other.file_.status.identity;
    return mine == others || (mine.device != others.device &&
                              changedAt_ / commonUnit == other.changedAt_ / commonUnit);
  }

  [[nodiscard]] bool isAtEnd() const { return length_ < blockLength; }
  [[nodiscard]] std::uint64_t offset() const { return offset_; }
  [[nodiscard]] bool hasSameBlock(const Reading& other) const {
    return length_ == other.length_ &&
           std::equal(block_.begin(), block_.begin() + static_cast<std::ptrdiff_t>(length_),
                      other.block_.begin());
  }

 private:
  const ComparedFile& file_;
  std::unique_ptr<OpenFile> open_;
  std::vector<std::byte> block_;
  std::size_t length_ = 0;  ///< Of what the block holds.
  std::uint64_t offset_ = 0;
  std::int64_t changedAt_ = 0;
};

/// The first that is no equality.
template <typename... Steps>
Comparison firstOf(const Steps&... steps) {
  Comparison comparison;
  static_cast<void>(((comparison = steps(), comparison.verdict == Verdict::equal) && ...));
  return comparison;
}

}  // namespace

Comparison compare(const ComparedFile& one, const ComparedFile& other, FileSystem& fileSystem,
                   Varnel::DiskAccessManager& disks, const std::atomic<bool>& shouldStop) {
  Reading first(one), second(other);
  for (bool isOpen = false; !isOpen || !first.isAtEnd();) {
    const auto firstPlace = placeOnDiskOf(one.path, disks);
    const auto secondPlace = placeOnDiskOf(other.path, disks);
    if (!firstPlace || !secondPlace) return {.verdict = Verdict::noAccess};
    if (!isOpen) {
      const Comparison opening =
          firstOf([&] { return first.open(fileSystem); }, [&] { return second.open(fileSystem); });
      if (opening.verdict != Verdict::equal) return opening;
      isOpen = true;
    }
    const std::uint64_t turnBegan = first.offset();
    do {
      if (shouldStop) return {.verdict = Verdict::stopped};
      const Comparison reading =
          firstOf([&] { return first.next(); }, [&] { return second.next(); });
      if (reading.verdict != Verdict::equal) return reading;
      // Whether a file that changes meanwhile still agrees is chance.
      const Comparison states =
          firstOf([&] { return first.checkState(); }, [&] { return second.checkState(); });
      if (states.verdict != Verdict::equal) return states;
      if (!first.hasSameBlock(second)) return {.verdict = Verdict::different};
    } while (!first.isAtEnd() && first.offset() - turnBegan < maxTurn);
  }
  return {.verdict = first.isOfSameFile(second) ? Verdict::different : Verdict::equal};
}

bool isStillThere(const ComparedFile& file, FileSystem& fileSystem) {
  const auto opened = openFile(file.path, fileSystem);
  const auto status = opened ? (*opened)->status() : opened.error();
  return status && status->hasContentOf(file.status);
}

}  // namespace Orvane
