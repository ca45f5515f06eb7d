// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Ports/DeviceRegistry.h>

#include <utility>

#include <Varnel/Platform/Linux/Adapters.h>
#include <Varnel/Platform/Linux/Disks/BlockDevices.h>
#include <Varnel/Platform/Linux/Disks/BlockTree.h>
#include <Varnel/Platform/Linux/Disks/VirtioSerials.h>

namespace Varnel::Platform::Linux {
namespace {

// Shows one node of a tree, which it keeps alive.
class TreeEntry final : public RegistryEntry {
 public:
  TreeEntry(std::shared_ptr<const BlockTree> tree, std::size_t node)
      : tree_(std::move(tree)), node_(tree_->nodes[node]) {}

  std::optional<PropertyValue> property(std::string_view name) const override {
    const PropertyValue* value = find(node_.properties, name);
    return value ? std::optional(*value) : std::nullopt;
  }

  std::optional<PropertyDictionary> properties() const override { return node_.properties; }

  std::unique_ptr<RegistryEntry> parent() const override {
    return node_.parent ? std::make_unique<TreeEntry>(tree_, *node_.parent) : nullptr;
  }

  std::vector<std::unique_ptr<RegistryEntry>> children() const override {
    std::vector<std::unique_ptr<RegistryEntry>> entries;
    entries.reserve(node_.children.size());
    for (const std::size_t child : node_.children)
      entries.push_back(std::make_unique<TreeEntry>(tree_, child));
    return entries;
  }

 private:
  const std::shared_ptr<const BlockTree> tree_;
  const BlockTree::Node& node_;
};

class SysfsDeviceRegistry final : public DeviceRegistry {
 public:
  explicit SysfsDeviceRegistry(std::string folder) : folder_(std::move(folder)) {}

  std::optional<Entries> entriesMatchingProperty(std::string_view name,
                                                 const PropertyValue& value) override {
    const BlockDevices devices(folder_.c_str());
    if (!devices) return std::nullopt;
    const auto tree = std::make_shared<const BlockTree>(readBlockTree(devices, virtioSerials_));
    Entries entries;
    for (std::size_t node = 0; node < tree->nodes.size(); ++node) {
      const PropertyValue* own = find(tree->nodes[node].properties, name);
      if (own && *own == value) entries.push_back(std::make_unique<TreeEntry>(tree, node));
    }
    return entries;
  }

 private:
  const std::string folder_;
  VirtioSerials virtioSerials_;
};

}  // namespace

std::unique_ptr<DeviceRegistry> makeDeviceRegistry(const std::string& folder) {
  return std::make_unique<SysfsDeviceRegistry>(folder);
}

}  // namespace Varnel::Platform::Linux
