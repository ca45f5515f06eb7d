// SPDX-License-Identifier: MIT
#include <Scan/Waste.h>

#include <algorithm>
#include <map>

namespace Orvane {
namespace {

/// Files that only go together: one, or those that lie at the same place.
struct Unit {
  std::uint64_t bytes = 0;        ///< What it takes up.
  std::uint64_t sharedBytes = 0;  ///< Of that, what other files hold as well.
  std::uint32_t files = 0;
  bool mustStay = false;
  bool hasOtherNames = false;

  [[nodiscard]] std::uint64_t freedBytes() const {
    if (mustStay || hasOtherNames) return 0;
    return files > 1 ? bytes : bytes - std::min(sharedBytes, bytes);
  }
};

class Waste final {
 public:
  Waste(const ScanResult& result, const std::vector<Footprint>& footprints,
        const std::vector<Sharing>& sharings)
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
    std::vector<Unit> units;
    std::map<std::uint64_t, std::size_t> unitAt;
    std::uint64_t references = 0;
    for (std::uint32_t i = group.begin; i < group.begin + group.count; ++i) {
      const FileNumber file = result_.files[i];
      const Sharing* const sharing = findFact(sharings_, file);
      std::size_t index = units.size();
      if (sharing) index = unitAt.try_emplace(sharing->extents.place, index).first->second;
      if (index == units.size()) units.emplace_back();
      Unit& unit = units[index];
      const Footprint* const footprint = findFact(footprints_, file);
      unit.bytes = footprint ? footprint->bytes : group.size;
      unit.sharedBytes = sharing ? sharing->extents.bytes : 0;
      ++unit.files;
      if (footprint && footprint->links > 1 + countLinks(file)) unit.hasOtherNames = true;
      if (!hasReferences_ || !result_.isReference(file)) continue;
      unit.mustStay = true;
      ++references;
    }
    std::uint64_t sum = 0;
    std::uint64_t least = units.front().freedBytes();
    for (const Unit& unit : units) {
      sum += unit.freedBytes();
      least = std::min(least, unit.freedBytes());
    }
    group.wastedBytes = references > 0 ? sum : sum - least;
    return group.count - std::max<std::uint64_t>(references, 1);
  }

 private:
  [[nodiscard]] std::uint64_t countLinks(FileNumber file) const {
    return result_.linksOf(file).size();
  }

  const ScanResult& result_;
  const std::vector<Footprint>& footprints_;
  const std::vector<Sharing>& sharings_;
  bool hasReferences_ = false;
};

}  // namespace

void computeWaste(ScanResult& result, const std::vector<Footprint>& footprints,
                  const std::vector<Sharing>& sharings) {
  const Waste waste(result, footprints, sharings);
  for (DuplicateGroup& group : result.groups) {
    result.totals.duplicateFiles += waste.fill(group);
    result.totals.wastedBytes += group.wastedBytes;
  }
}

}  // namespace Orvane
