// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>
#include <cstdint>
#include <memory>
#include <string>
#include <string_view>
#include <system_error>
#include <vector>

#include <Varnel/Platform/Api.h>

namespace Varnel::Platform {

/// What the processes of a user's session share while they run: places of which so many are to be
/// had, and a note of each process that the others may read. The system frees the places of a
/// process that ends, however it ends, and nobody sees its note any more.
///
///     const auto place = board.takePlace("disk-4711", 1, SessionBoard::Wait::forPlace);
///     …  // no other process, and no other thread, is here
///
/// Any thread. What a process holds, a child that it forks holds too, as long as that runs no other
/// program.
class VARNEL_API SessionBoard {
 public:
  /// A place that is held. Destruction gives it back.
  class VARNEL_API Place {
   public:
    virtual ~Place() = default;
    Place& operator=(const Place&) = delete;
  };

  enum class Wait {
    no,
    /// Until there is one, or for as long as `takePlace` says: behind those that wait already, and
    /// not to be interrupted.
    forPlace,
  };

  virtual ~SessionBoard() = default;
  SessionBoard& operator=(const SessionBoard&) = delete;

  /// One of `count` places, at least 1, of that name; null when none is free and none is waited
  /// for. Who does not wait passes nobody who does. Where the session has no such board, anybody
  /// gets a place that means nothing, and so does, for a while, who has waited for longer than
  /// readers take: a process that was stopped, or is stuck, keeps nobody waiting for ever.
  [[nodiscard]] virtual std::unique_ptr<Place> takePlace(const std::string& name, unsigned count,
                                                         Wait wait) = 0;

  /// Puts the process's note in the place of its last, all at once. Fails where there is no board.
  [[nodiscard]] virtual std::error_code post(std::string_view text) = 0;
  virtual void withdraw() = 0;

  struct Note {
    std::int64_t process = 0;  ///< The number that the system gave it.
    std::string text{};
    bool operator==(const Note&) const = default;
  };
  /// The notes of all that run, in no order. Any process of the user may have written anything.
  [[nodiscard]] virtual std::vector<Note> notes() = 0;

  static constexpr std::size_t maxNoteSize = 64u << 10;
};

}  // namespace Varnel::Platform
