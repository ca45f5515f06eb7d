// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <vector>

#include <nlohmann/json_fwd.hpp>

#include <Varnel/Platform/Ports/SessionBoard.h>

namespace Orvane {

using Notes = std::vector<Varnel::Platform::SessionBoard::Note>;

/// Which processes read which disks, as they tell it themselves, the oldest process number first.
/// What is no such note is left out.
[[nodiscard]] std::string textOfLiveDisks(const Notes& notes);
[[nodiscard]] nlohmann::ordered_json jsonOfLiveDisks(const Notes& notes);

}  // namespace Orvane
