// SPDX-License-Identifier: MIT
#pragma once

#include <functional>
#include <memory>

#include <orvane/CommandValues.h>

namespace Orvane {

// What the entries of several commands have in common.

/// What runs the command that the options have filled in.
template <typename C>
std::function<int(Console&)> runs(std::shared_ptr<C> command) {
  return [command](Console& console) { return command->run(console); };
}

template <typename C>
Option json(std::shared_ptr<C> command) {
  return {.letter = 'j',
          .name = "json",
          .description = "Print one JSON object",
          .value = flag(command, &C::isJSON)};
}

inline const JSONField schemaVersionField = {
    "schemaVersion", "1; another number where a field has changed its meaning"};

}  // namespace Orvane
