// SPDX-License-Identifier: MIT
#pragma once

#include <memory>
#include <string>
#include <vector>

#include <orvane/Command.h>

namespace Orvane {

/// All that the program understands. Made for one parse: see `Command`.
struct CommandTable {
  /// What the options of every command ask for.
  struct Wishes {
    bool help = false;
    bool version = false;
    bool verbose = false;
    bool logToStandardOutput = false;
  };

  CommandTable();

  std::shared_ptr<Wishes> wishes = std::make_shared<Wishes>();
  std::vector<Option> options;  ///< Of every command.
  std::vector<Command> commands;

  /// The command of this name, or null.
  [[nodiscard]] const Command* find(const std::string& name) const;
  /// Those whose names begin with this word and have a second one.
  [[nodiscard]] std::vector<const Command*> below(const std::string& word) const;
};

/// What the program's exit statuses mean.
struct ExitStatus {
  const char* numbers;
  const char* meaning;
};
inline constexpr ExitStatus exitStatuses[] = {
    {"0", "done, also when some files could not be read"},
    {"1",
     "failed: a folder is missing or cannot be opened, the result could not be written, an answer "
     "not kept"},
    {"2", "wrong arguments"},
    {"3", "some files were not moved, shared, put back or erased"},
    {"129, 130, 143", "ended by SIGHUP, SIGINT, SIGTERM; a second signal ends it at once"},
    {"141", "the reader of the result went away; nothing is said then"},
};

}  // namespace Orvane
