// SPDX-License-Identifier: MIT
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <memory>
#include <optional>
#include <span>
#include <vector>

#include <Scan/Candidate.h>
#include <Scan/FileSystem.h>
#include <Scan/Loss.h>
#include <Scan/OpenFolders.h>

namespace Orvane {

/// What digests depend on: random, and another for each scan, so that nobody can make files that
/// differ but have one digest.
class DigestSecret final {
 public:
  /// Draws a secret.
  DigestSecret();

  [[nodiscard]] std::span<const std::byte> bytes() const { return bytes_; }

 private:
  std::array<std::byte, 192> bytes_;
};

/// Reads one file after the other, each in as many steps as its caller likes. With the last step it
/// makes sure that the file is still the one, and in the state, that the walk saw.
///
///     reader.begin(file, Look::head);
///     while (!reader.step()) …
///     if (const auto& loss = reader.loss()) …
///     use(reader.digest());
///
/// One thread at a time.
class ContentReader final {
 public:
  /// All outlive the reader.
  ContentReader(const FileTree& tree, FileSystem& fileSystem, const DigestSecret& secret);
  ~ContentReader();
  ContentReader(const ContentReader&) = delete;
  ContentReader& operator=(const ContentReader&) = delete;

  void begin(FileNumber file, Look look);

  /// Reads the next block. True when the file is finished, or lost.
  [[nodiscard]] bool step();

  /// How many bytes the last step read.
  [[nodiscard]] std::uint64_t stepLength() const { return stepLength_; }

  /// The next four tell of a file that is finished.
  [[nodiscard]] const std::optional<Loss>& loss() const { return loss_; }
  [[nodiscard]] const FileStatus& status() const { return status_; }
  /// Of what the look shows; of the rest alone when the head was read with it.
  [[nodiscard]] Digest digest() const { return digest_; }
  [[nodiscard]] Digest headDigest() const { return headDigest_; }

  /// How many bytes a look reads of a file of this size.
  [[nodiscard]] static std::uint64_t lengthOf(Look look, std::uint64_t size);

  /// How large a file may be to be read in one block.
  static constexpr std::uint64_t blockLength = std::uint64_t{256} << 10;

  /// Where the file lies on its volume, if that can be told. Reads nothing.
  [[nodiscard]] std::optional<std::uint64_t> placeOf(FileNumber file);

 private:
  struct Range {
    std::uint64_t begin;
    std::uint64_t end;
  };
  class Hash;

  [[nodiscard]] static std::array<Range, 2> rangesOf(Look look, std::uint64_t size);
  [[nodiscard]] FileResult<std::unique_ptr<OpenFile>> open(ReadingPlan plan);
  [[nodiscard]] bool lose(const Loss& loss);
  [[nodiscard]] bool finish();

  const FileTree& tree_;
  const DigestSecret& secret_;
  OpenFolders folders_;
  std::vector<std::byte> buffer_;
  const std::unique_ptr<Hash> hash_;

  FileNumber file_ = Candidate::lost;
  Look look_ = Look::head;
  std::array<Range, 2> ranges_{};  ///< What is left to read; the second one may be empty.
  std::unique_ptr<OpenFile> open_;
  bool isFirstBlock_ = false;
  std::uint64_t stepLength_ = 0;
  std::optional<Loss> loss_;
  FileStatus status_{};
  Digest digest_{};
  Digest headDigest_{};
};

}  // namespace Orvane
