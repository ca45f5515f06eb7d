// SPDX-License-Identifier: MIT
#include <orvane/JSONLine.h>

#include <nlohmann/json.hpp>

namespace Orvane {

std::string jsonLine(const nlohmann::ordered_json& json) {
  return json.dump(-1, ' ', false, nlohmann::ordered_json::error_handler_t::replace) + "\n";
}

}  // namespace Orvane
