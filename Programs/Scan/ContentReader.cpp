// SPDX-License-Identifier: MIT
#include <Scan/ContentReader.h>

#define XXH_INLINE_ALL
#include <xxhash.h>

#include <cstring>

#include <Scan/FileTree.h>
#include <Scan/ScanObserver.h>

namespace Orvane {
namespace {

/// Large enough to keep a rotating disk from seeking all the time, small enough to stay near the
/// processor and to let an urgent reader of the disk in soon.
constexpr std::size_t blockSize = 512 * 1024;

Digest digestFrom(const XXH128_hash_t& hash) {
  return {hash.high64, hash.low64};
}

}  // namespace

ContentReader::ContentReader(ContentStream::Ports ports, ScanControl& control)
    : ports_(ports), control_(control), firstBuffer_(blockSize), secondBuffer_(blockSize) {}

ContentReader::DigestResult ContentReader::digest(const FileRecord& file, std::uint64_t length) {
  ContentStream stream(file, length, ports_);
  auto block = readBlock(stream, firstBuffer_);
  if (!block) return block.error();
  if (stream.isFinished()) return digestFrom(XXH3_128bits(block->data(), block->size()));

  XXH3_state_t state;
  XXH3_128bits_reset(&state);
  XXH3_128bits_update(&state, block->data(), block->size());
  while (!stream.isFinished() && !control_.isCancelled) {
    block = readBlock(stream, firstBuffer_);
    if (!block) return block.error();
    XXH3_128bits_update(&state, block->data(), block->size());
  }
  return digestFrom(XXH3_128bits_digest(&state));
}

Comparison ContentReader::compare(const FileRecord& first, const FileRecord& second) {
  ContentStream firstStream(first, first.status.size, ports_);
  ContentStream secondStream(second, second.status.size, ports_);
  while (!firstStream.isFinished() && !control_.isCancelled) {
    const auto firstBlock = readBlock(firstStream, firstBuffer_);
    if (!firstBlock) return {.firstLoss = firstBlock.error()};
    const auto secondBlock = readBlock(secondStream, secondBuffer_);
    if (!secondBlock) return {.secondLoss = secondBlock.error()};
    if (std::memcmp(firstBlock->data(), secondBlock->data(), firstBlock->size()) != 0) return {};
  }
  return {.isEqual = firstStream.isFinished()};
}

ContentStream::Block ContentReader::readBlock(ContentStream& stream,
                                              std::vector<std::byte>& buffer) {
  ContentStream::Block block = stream.next(buffer);
  if (block) control_.bytesRead.fetch_add(block->size(), std::memory_order_relaxed);
  return block;
}

}  // namespace Orvane
