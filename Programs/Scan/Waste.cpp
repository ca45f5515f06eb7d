// SPDX-License-Identifier: MIT
#include <Scan/Waste.h>

#include <algorithm>
#include <optional>

#include <Scan/FreedSpace.h>

namespace Orvane {
namespace {

class Waste final {
 public:
  Waste(const ScanResult& result, const std::vector<Footprint>& footprints,
        const std::vector<FileSharing>& sharings)
      : result_(result), footprints_(footprints), sharings_(sharings) {
    for (const Folder& folder : result.tree->folders())
      hasReferences_ = hasReferences_ || folder.isReference;
  }

  /// Counts the files that could go, and fills in what they free.
  std::uint64_t fill(DuplicateGroup& group) const {
    if (!hasReferences_ && footprints_.empty() && sharings_.empty()) {
      group.wastedBytes = group.size * (group.count - 1);
      return group.count - 1;
    }
    FreedSpace space;
    std::uint64_t references = 0;
    for (std::uint32_t i = group.begin; i < group.begin + group.count; ++i) {
      const FileNumber file = result_.files[i];
      const FileSharing* const sharing = findFact(sharings_, file);
      const Footprint* const footprint = findFact(footprints_, file);
      const bool isReference = hasReferences_ && result_.isReference(file);
      references += isReference;
      space.add({.bytes = footprint ? footprint->bytes : group.size,
                 .shared = sharing ? std::optional(sharing->extents) : std::nullopt,
                 .isHeld = isReference || (footprint && footprint->links > 1 + countLinks(file))});
    }
    group.wastedBytes = space.sum() - (references > 0 ? 0 : space.least());
    return group.count - std::max<std::uint64_t>(references, 1);
  }

 private:
  [[nodiscard]] std::uint64_t countLinks(FileNumber file) const {
    return result_.linksOf(file).size();
  }

  const ScanResult& result_;
  const std::vector<Footprint>& footprints_;
  const std::vector<FileSharing>& sharings_;
  bool hasReferences_ = false;
};

}  // namespace

void computeWaste(ScanResult& result, const std::vector<Footprint>& footprints,
                  const std::vector<FileSharing>& sharings) {
  const Waste waste(result, footprints, sharings);
  for (DuplicateGroup& group : result.groups) {
    result.totals.duplicateFiles += waste.fill(group);
    result.totals.wastedBytes += group.wastedBytes;
  }
}

}  // namespace Orvane
