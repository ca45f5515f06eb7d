// SPDX-License-Identifier: MIT
#pragma once

#include <atomic>
#include <map>
#include <memory>
#include <mutex>
#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include <Varnel/Platform/Ports/DeviceRegistry.h>
#include <Varnel/Platform/Testing/FaultPlan.h>

namespace Varnel::Platform::Testing {

/// A tree of devices that the test plugs together, and a count of the entries in use. Any thread.
///
///     FakeDeviceRegistry registry;
///     const auto ssd = registry.plug({{"SMART Capable", true}});
///     registry.plug({{"BSD Name", "sda"}}, ssd);
///     …
///     EXPECT_EQ(registry.liveEntries(), 0);  // every handle was given back
///
/// Entries tell what was plugged in when they were looked up.
class FakeDeviceRegistry final : public DeviceRegistry {
 public:
  using Device = int;
  static constexpr Device root = 0;

 private:
  struct Node {
    PropertyDictionary properties;
    Device parent = root;
    std::vector<Device> children;
    bool propertiesBroken = false;
    bool parentBroken = false;
  };

  using Nodes = std::map<Device, Node>;

  struct State {
    std::shared_ptr<FaultPlan> faults = std::make_shared<FaultPlan>();
    std::mutex mutex;  ///< Owns the rest.
    Nodes nodes{{root, {}}};
    Device last = root;
    std::atomic<int> live = 0;
    bool readable = true;

    void remove(Device device) {
      const auto found = nodes.find(device);
      if (found == nodes.end()) return;
      const std::vector<Device> below = std::move(found->second.children);
      nodes.erase(found);
      for (auto& [other, node] : nodes) std::erase(node.children, device);
      for (const Device child : below) remove(child);
    }
  };

  const std::shared_ptr<State> state_ = std::make_shared<State>();

 public:
  /// The look-up, and the questions to its entries. What goes wrong finds nothing.
  std::shared_ptr<FaultPlan>& faults = state_->faults;

  /// Adds a device below another. The order of plugging is the registry's order.
  Device plug(PropertyDictionary properties, Device parent = root) {
    const std::lock_guard lock(state_->mutex);
    const Device device = ++state_->last;
    state_->nodes[device] = {.properties = std::move(properties), .parent = parent, .children = {}};
    state_->nodes[parent].children.push_back(device);
    return device;
  }

  /// Hangs a device below another one as well, as a RAID below each of its disks.
  void attach(Device device, Device parent) {
    const std::lock_guard lock(state_->mutex);
    state_->nodes[parent].children.push_back(device);
  }

  /// Takes a device away, with everything below it.
  void unplug(Device device) {
    const std::lock_guard lock(state_->mutex);
    state_->remove(device);
  }

  /// From now on the device's list of properties, or its parent, cannot be read. Single properties
  /// can.
  void breakProperties(Device device) {
    const std::lock_guard lock(state_->mutex);
    state_->nodes[device].propertiesBroken = true;
  }
  void breakParent(Device device) {
    const std::lock_guard lock(state_->mutex);
    state_->nodes[device].parentBroken = true;
  }

  /// A registry that cannot be read finds nothing at all.
  void setReadable(bool readable) {
    const std::lock_guard lock(state_->mutex);
    state_->readable = readable;
  }

  /// How many entries are held right now.
  [[nodiscard]] int liveEntries() const { return state_->live; }

  /// The entry of a device, as the registry would hand it out.
  [[nodiscard]] std::unique_ptr<RegistryEntry> entry(Device device) const {
    const std::lock_guard lock(state_->mutex);
    return std::make_unique<Entry>(state_, std::make_shared<const Nodes>(state_->nodes), device);
  }

  std::optional<Entries> entriesMatchingProperty(std::string_view name,
                                                 const PropertyValue& value) override {
    if (faults->strikes()) return std::nullopt;
    const std::lock_guard lock(state_->mutex);
    if (!state_->readable) return std::nullopt;
    const auto nodes = std::make_shared<const Nodes>(state_->nodes);
    Entries entries;
    for (const auto& [device, node] : *nodes) {
      const PropertyValue* own = find(node.properties, name);
      if (own && *own == value) entries.push_back(std::make_unique<Entry>(state_, nodes, device));
    }
    return entries;
  }

 private:
  // Shares the state, and so may outlive the registry.
  class Entry final : public RegistryEntry {
   public:
    Entry(std::shared_ptr<State> state, std::shared_ptr<const Nodes> nodes, Device device)
        : state_(std::move(state)), nodes_(std::move(nodes)), node_(nodes_->at(device)) {
      ++state_->live;
    }
    ~Entry() override { --state_->live; }
    Entry(const Entry&) = delete;
    Entry& operator=(const Entry&) = delete;

    std::optional<PropertyValue> property(std::string_view name) const override {
      if (state_->faults->strikes()) return std::nullopt;
      const PropertyValue* value = find(node_.properties, name);
      return value ? std::optional(*value) : std::nullopt;
    }

    std::optional<PropertyDictionary> properties() const override {
      if (state_->faults->strikes() || node_.propertiesBroken) return std::nullopt;
      return node_.properties;
    }

    std::unique_ptr<RegistryEntry> parent() const override {
      if (state_->faults->strikes() || node_.parent == root || node_.parentBroken) return nullptr;
      return std::make_unique<Entry>(state_, nodes_, node_.parent);
    }

    DeviceRegistry::Entries children() const override {
      DeviceRegistry::Entries entries;
      if (state_->faults->strikes()) return entries;
      for (const Device child : node_.children)
        entries.push_back(std::make_unique<Entry>(state_, nodes_, child));
      return entries;
    }

   private:
    const std::shared_ptr<State> state_;
    const std::shared_ptr<const Nodes> nodes_;
    const Node& node_;
  };
};

}  // namespace Varnel::Platform::Testing
