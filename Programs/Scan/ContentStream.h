// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <span>
#include <string>

#include <Scan/FileSystem.h>
#include <Scan/Loss.h>

namespace Orvane {

class ContentAccess;
struct FileRecord;

/// Reads a file's content from its beginning, each block inside an access of its own, so that a
/// more urgent reader of the disk waits for one block at most. With the last block it makes sure
/// that the file is still the one, and in the state, that the walk saw.
///
///     ContentStream stream(file, file.status.size, {fileSystem, access});
///     do {
///       auto block = stream.next(buffer);
///       if (!block) return block.error();
///       use(*block);
///     } while (!stream.isFinished());
///
/// One thread at a time.
class ContentStream final {
 public:
  struct Ports {
    FileSystem& fileSystem;
    ContentAccess& access;
  };
  using Block = Varnel::Platform::Result<std::span<const std::byte>, Loss>;

  /// `length`: how much to read, at most the file's size.
  ContentStream(const FileRecord& file, std::uint64_t length, Ports ports);
  ContentStream(const ContentStream&) = delete;
  ContentStream& operator=(const ContentStream&) = delete;

  /// The next bytes: a full buffer, or less where the length ends. Waits for access. After a loss
  /// the stream is of no more use.
  [[nodiscard]] Block next(std::span<std::byte> buffer);

  /// Whether everything has been read and found unchanged.
  [[nodiscard]] bool isFinished() const { return remaining_ == 0; }

 private:
  Block readBlock(std::span<std::byte> buffer);

  Ports ports_;
  const FileRecord& file_;
  std::string path_;
  std::uint64_t remaining_;
  std::unique_ptr<OpenFile> open_;
};

}  // namespace Orvane
