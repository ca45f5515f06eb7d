// SPDX-License-Identifier: MIT
#pragma once

#include <condition_variable>
#include <map>
#include <mutex>
#include <optional>
#include <set>
#include <string>
#include <vector>

#include <Varnel/Platform/Ports/SessionBoard.h>

namespace Varnel::Platform::Testing {

/// The board of a session whose other processes the test plays. Any thread.
///
///     FakeSessionBoard board;
///     board.setNotesOfOthers({{.process = 4711, .text = "…"}});
///     const auto place = board.takePlace("disk", 1, SessionBoard::Wait::no);  // another process's
class FakeSessionBoard final : public SessionBoard {
 public:
  std::unique_ptr<Place> takePlace(const std::string& name, unsigned count, Wait wait) override {
    std::unique_lock lock(mutex_);
    Line& line = lines_[name];
    if (wait == Wait::no && (line.held >= count || line.left < line.came)) return nullptr;
    const unsigned long number = line.came++;
    changed_.notify_all();
    changed_.wait(lock, [&] { return line.left == number && line.held < count; });
    ++line.left;
    ++line.held;
    changed_.notify_all();
    return std::make_unique<HeldPlace>(*this, line);
  }

  std::error_code post(std::string_view text) override {
    const std::lock_guard lock(mutex_);
    if (text.size() > maxNoteSize) return std::make_error_code(std::errc::file_too_large);
    note_ = text;
    return {};
  }
  void withdraw() override {
    const std::lock_guard lock(mutex_);
    note_.reset();
  }
  std::vector<Note> notes() override {
    const std::lock_guard lock(mutex_);
    auto notes = others_;
    if (note_) notes.push_back({1, *note_});
    return notes;
  }

  void setNotesOfOthers(std::vector<Note> notes) {
    const std::lock_guard lock(mutex_);
    others_ = std::move(notes);
  }

  /// The names of which somebody has ever wanted a place.
  [[nodiscard]] std::set<std::string> placeNames() {
    const std::lock_guard lock(mutex_);
    std::set<std::string> names;
    for (const auto& [name, line] : lines_) names.insert(name);
    return names;
  }
  void awaitWaiter(const std::string& name) {
    std::unique_lock lock(mutex_);
    changed_.wait(lock, [&] { return lines_[name].left < lines_[name].came; });
  }

 private:
  struct Line {
    unsigned held = 0;
    unsigned long came = 0;
    unsigned long left = 0;  ///< Of those that came: to a place.
  };
  class HeldPlace final : public Place {
   public:
    HeldPlace(FakeSessionBoard& board, Line& line) : board_(board), line_(line) {}
    ~HeldPlace() override {
      const std::lock_guard lock(board_.mutex_);
      --line_.held;
      board_.changed_.notify_all();
    }

   private:
    FakeSessionBoard& board_;
    Line& line_;
  };

  std::mutex mutex_;  ///< Owns what follows.
  std::condition_variable changed_;
  std::map<std::string, Line> lines_;
  std::optional<std::string> note_;
  std::vector<Note> others_;
};

}  // namespace Varnel::Platform::Testing
