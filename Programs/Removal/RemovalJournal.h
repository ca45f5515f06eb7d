// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include <Varnel/Platform/Ports/PrivateFiles.h>
#include <Varnel/Platform/Ports/Trash.h>
#include <Varnel/Platform/SQLite/DurableFile.h>
#include <Varnel/Platform/Values/Date.h>

namespace Orvane {

/// A removal that the journal knows.
struct RemovalRecord {
  std::string identifier{};  ///< By which the journal knows it.
  std::int64_t number = 0;   ///< By which people name it.
  Varnel::Platform::Date began{};
  std::uint64_t files = 0;     ///< Names that were to be moved.
  std::uint64_t bytes = 0;     ///< Of those.
  std::uint64_t restored = 0;  ///< Names that are back in their places.
  std::uint64_t lost = 0;      ///< Names that the trash did not have any more.
};

/// What was moved to the trash, for as long as it can be given back. Every file is in the journal
/// before it is moved. A kill at any moment leaves it whole, and so does a loss of power.
///
/// One thread at a time; processes share the file. An error is of the file: see `meaningOf`.
class RemovalJournal final {
 public:
  using Failure = std::optional<Varnel::Platform::PlatformError>;
  using Lock = std::unique_ptr<Varnel::Platform::FileLock>;

  /// What has become of a file.
  enum class State {
    moved,     ///< It is in the trash, or about to be moved there.
    restored,  ///< It is back in its place, or never left it.
    lost,      ///< The trash did not have it any more.
  };
  struct Entry {
    Varnel::Platform::TrashedFile file;
    State state = State::moved;
  };

  /// The product's journal, beside what else it keeps for this user.
  [[nodiscard]] static std::string productPath();

  RemovalJournal(Varnel::Platform::DurableFile::Ports ports, const std::string& path);

  /// Only one removal or restoration is made at a time: a null lock when another one is.
  [[nodiscard]] Varnel::Platform::Result<Lock> lock();

  /// Begins a removal, and forgets those of which nothing is left to give back.
  [[nodiscard]] Varnel::Platform::Result<RemovalRecord> begin(Varnel::Platform::Date now);

  /// Notes where a file is about to be moved. A file has one note in a removal: the last.
  [[nodiscard]] Failure note(const RemovalRecord& removal,
                             const Varnel::Platform::TrashedFile& file);
  /// Takes back the note of one that was not moved.
  [[nodiscard]] Failure forget(const RemovalRecord& removal, const std::string& path);

  /// The removals of which something was noted, the latest first.
  [[nodiscard]] Varnel::Platform::Result<std::vector<RemovalRecord>> removals();
  /// What is noted of one, in the order in which it was moved.
  [[nodiscard]] Varnel::Platform::Result<std::vector<Entry>> entries(const RemovalRecord& removal);
  [[nodiscard]] Failure setState(const RemovalRecord& removal, const std::string& path,
                                 State state);

 private:
  const Varnel::Platform::DurableFile::Ports ports_;
  const std::string path_;
  Varnel::Platform::DurableFile file_;
};

}  // namespace Orvane
