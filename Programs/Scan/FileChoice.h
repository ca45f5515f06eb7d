// SPDX-License-Identifier: MIT
#pragma once

#include <cstdint>
#include <string_view>
#include <vector>

#include <Scan/Glob.h>

namespace Orvane {

struct Folder;
struct ScanRequest;

/// Tells which files a request chooses among those that are found. Immutable; any thread.
class FileChoice final {
 public:
  /// The request outlives the choice.
  explicit FileChoice(const ScanRequest& request);

  [[nodiscard]] bool hasChosenSize(std::uint64_t size) const;

  /// Whether a file that was found in the folder takes part, as far as its name tells.
  [[nodiscard]] bool takes(const Folder& folder, std::string_view name) const;

  /// Whether the way from the folder down to another one, by a name or several, is to be gone.
  [[nodiscard]] bool enters(const Folder& folder, std::string_view way) const;

 private:
  using Globs = std::vector<Glob>;
  [[nodiscard]] static bool isAmong(const Globs& globs, Glob::Kind kind, const Folder& folder,
                                    std::string_view way);
  [[nodiscard]] bool leavesOut(Glob::Kind kind, const Folder& folder, std::string_view way) const;

  const ScanRequest& request_;
  const Globs include_;
  const Globs exclude_;
};

}  // namespace Orvane
