// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <vector>

#include <orvane/ProductData.h>

namespace Orvane {

struct LeftFile {
  std::string path;
  std::string reason;
};

/// What has become of a part that was to be erased.
struct Erasure {
  std::vector<LeftFile> left{};  ///< What is there still.
};

/// Removes a part under its locks, so that no process of the product loses what it is about to
/// write, or brings back what was erased. Waits a few seconds for others. What another process has
/// open stays, without what was in it.
[[nodiscard]] Erasure erase(const DataPart& part);

}  // namespace Orvane
