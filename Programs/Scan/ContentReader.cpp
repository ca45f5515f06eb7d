// SPDX-License-Identifier: MIT
#include <Scan/ContentReader.h>

#define XXH_INLINE_ALL
#include <xxhash.h>

#include <algorithm>
#include <cstring>
#include <random>
#include <utility>

namespace Orvane {
namespace {

/// How much of the middle and of the end is looked at: one page, or a little more.
constexpr std::uint64_t pageLength = 4096;

std::uint64_t pageBefore(std::uint64_t offset) {
  return offset - offset % pageLength;
}

Digest digestFrom(const XXH128_hash_t& hash) {
  return {hash.high64, hash.low64};
}

}  // namespace

DigestSecret::DigestSecret() {
  std::random_device random;
  for (std::size_t i = 0; i < bytes_.size(); i += sizeof(unsigned)) {
    const unsigned drawn = random();
    std::memcpy(bytes_.data() + i, &drawn, sizeof drawn);
  }
}

/// The digest of all blocks of one file. A single block goes without the state, which costs more
/// than a small file's digest.
class ContentReader::Hash final {
 public:
  explicit Hash(const DigestSecret& secret) : secret_(secret.bytes()) {}

  [[nodiscard]] Digest of(std::span<const std::byte> bytes) const {
    return digestFrom(
        XXH3_128bits_withSecret(bytes.data(), bytes.size(), secret_.data(), secret_.size()));
  }
  void reset() { XXH3_128bits_reset_withSecret(&state_, secret_.data(), secret_.size()); }
  void add(std::span<const std::byte> bytes) {
    XXH3_128bits_update(&state_, bytes.data(), bytes.size());
  }
  [[nodiscard]] Digest digest() const { return digestFrom(XXH3_128bits_digest(&state_)); }

 private:
  std::span<const std::byte> secret_;
  XXH3_state_t state_;
};

ContentReader::ContentReader(const FileTree& tree, FileSystem& fileSystem,
                             const DigestSecret& secret)
    : tree_(tree),
      secret_(secret),
      folders_(fileSystem),
      buffer_(blockLength),
      hash_(std::make_unique<Hash>(secret_)) {}

ContentReader::~ContentReader() = default;

std::array<ContentReader::Range, 2> ContentReader::rangesOf(Look look, std::uint64_t size) {
  const Range middle{pageBefore(size / 2), pageBefore(size / 2) + pageLength};
  const Range end{pageBefore(size - std::min(size, pageLength)), size};
  switch (look) {
    case Look::head:
      return {Range{0, std::min(size, headLength)}};
    case Look::samples:
      return {middle, end};
    case Look::rest:
      if (size < worthSamples) return {Range{headLength, size}};
      return {Range{headLength, middle.begin}, Range{middle.end, end.begin}};
    case Look::headAndRest:
      break;
  }
  return {Range{0, size}};
}

std::uint64_t ContentReader::lengthOf(Look look, std::uint64_t size) {
  std::uint64_t length = 0;
  for (const Range& range : rangesOf(look, size)) length += range.end - range.begin;
  return length;
}

void ContentReader::begin(FileNumber file, Look look) {
  file_ = file;
  look_ = look;
  ranges_ = rangesOf(look, tree_.file(file).size);
  isFirstBlock_ = true;
  loss_.reset();
}

bool ContentReader::step() {
  stepLength_ = 0;
  if (isFirstBlock_) {
    const bool isPart =
        look_ == Look::samples || (look_ == Look::head && tree_.file(file_).size > headLength);
    auto opened = open(isPart ? ReadingPlan::parts : ReadingPlan::everything);
    if (!opened) return lose(Loss::because(opened.error()));
    open_ = std::move(*opened);
  }
  Range& range = ranges_[0];
  const auto wanted = static_cast<std::size_t>(std::min(blockLength, range.end - range.begin));
  while (stepLength_ < wanted) {
    const auto count =
        open_->read(range.begin, std::span(buffer_).subspan(stepLength_, wanted - stepLength_));
    if (!count) return lose(Loss::because(count.error()));
    if (*count == 0) return lose({Loss::Kind::changed, {}});
    stepLength_ += *count;
    range.begin += *count;
  }
  if (range.begin == range.end) ranges_[0] = std::exchange(ranges_[1], {});
  const std::span<const std::byte> block(buffer_.data(), wanted);
  const bool isLast = ranges_[0].begin == ranges_[0].end;
  if (look_ == Look::headAndRest) {
    headDigest_ = hash_->of(block.first(headLength));
    digest_ = hash_->of(block.subspan(headLength));
  } else if (isFirstBlock_ && isLast) {
    digest_ = hash_->of(block);
  } else {
    if (isFirstBlock_) hash_->reset();
    hash_->add(block);
    if (isLast) digest_ = hash_->digest();
  }
  isFirstBlock_ = false;
  return isLast && finish();
}

std::optional<std::uint64_t> ContentReader::placeOf(FileNumber file) {
  file_ = file;
  const auto opened = open(ReadingPlan::everything);
  return opened ? (*opened)->place() : std::nullopt;
}

FileResult<std::unique_ptr<OpenFile>> ContentReader::open(ReadingPlan plan) {
  const auto folder = folders_.open(tree_.folderOf(file_));
  if (!folder) return folder.error();
  auto opened = (*folder)->open(tree_.nameOf(file_), plan);
  if (opened || opened.error() != std::errc::too_many_files_open) return opened;
  folders_.doWithFew();
  return (*folder)->open(tree_.nameOf(file_), plan);
}

bool ContentReader::lose(const Loss& loss) {
  loss_ = loss;
  open_.reset();
  return true;
}

bool ContentReader::finish() {
  const auto status = open_->status();
  if (!status) return lose(Loss::because(status.error()));
  if (!tree_.isUnchanged(file_, *status)) return lose({Loss::Kind::changed, {}});
  status_ = *status;
  open_.reset();
  return true;
}

}  // namespace Orvane
