// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Linux/Disks/BlockTree.h>

#include <algorithm>
#include <map>
#include <string_view>
#include <utility>

#include <Varnel/Platform/Linux/Disks/BlockDevices.h>

namespace Varnel::Platform::Linux {
namespace {

using Node = std::size_t;

PropertyDictionary propertiesOf(const StorageDevice& device) {
  const bool isCapable = isSmartCapable(device);
  PropertyDictionary properties{{"SMART Capable", isCapable}};
  if (isCapable)
    properties.emplace("Device Characteristics",
                       PropertyDictionary{{"Medium Type", std::string(mediumType(device))},
                                          {"Serial Number", identifyingSerial(device)}});
  return properties;
}

class Builder final {
 public:
  Builder(const BlockDevices& devices, VirtioSerials& virtioSerials)
      : devices_(devices), virtioSerials_(virtioSerials) {
    for (std::string& name : devices_.names()) {
      std::string place = devices_.place(name);
      places_.emplace(std::move(name), std::move(place));
    }
  }

  BlockTree build() && {
    for (const auto& [name, place] : places_) addDisk(name, place);
    for (const auto& [name, place] : places_) placeUnderWhatItStandsOn(name, place);
    return std::move(tree_);
  }

 private:
  Node add(PropertyDictionary properties) {
    tree_.nodes.push_back({.properties = std::move(properties), .parent = {}, .children = {}});
    return tree_.nodes.size() - 1;
  }

  // A partition's folder lies in that of its disk.
  bool isPartition(std::string_view place) const {
    return places_.contains(lastComponent(folderOf(place)));
  }

  void addDisk(const std::string& name, std::string_view place) {
    std::optional<Node> storage;
    if (!place.empty() && !isVirtual(place) && !isPartition(place))
      storage = add(propertiesOf(devices_.storageDevice(name, place, virtioSerials_)));
    const Node disk = add({{"BSD Name", name}});
    nodes_.emplace(name, disk);
    if (storage) attach(disk, *storage);
  }

  void placeUnderWhatItStandsOn(const std::string& name, std::string_view place) {
    const Node node = nodes_.find(name)->second;
    if (isPartition(place)) {
      attach(node, nodes_.find(lastComponent(folderOf(place)))->second);
    } else if (isVirtual(place)) {
      for (const std::string& lower : devices_.lowerDevices(name))
        if (const auto found = nodes_.find(lower); found != nodes_.end())
          attach(node, found->second);
    }
  }

  void attach(Node child, Node parent) {
    if (isBelow(parent, child)) return;
    tree_.nodes[parent].children.push_back(child);
    if (!tree_.nodes[child].parent) tree_.nodes[child].parent = parent;
  }

  // Whether a node is the other one or stands somewhere below it.
  bool isBelow(Node node, Node other) const {
    if (node == other) return true;
    const auto& children = tree_.nodes[other].children;
    return std::any_of(children.begin(), children.end(),
                       [&](Node child) { return isBelow(node, child); });
  }

  const BlockDevices& devices_;
  VirtioSerials& virtioSerials_;
  std::map<std::string, std::string, std::less<>> places_;
  std::map<std::string, Node, std::less<>> nodes_;
  BlockTree tree_;
};

}  // namespace

BlockTree readBlockTree(const BlockDevices& devices, VirtioSerials& virtioSerials) {
  return Builder(devices, virtioSerials).build();
}

}  // namespace Varnel::Platform::Linux
