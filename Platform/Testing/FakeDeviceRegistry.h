// SPDX-License-Identifier: MIT
#pragma once

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
/// An entry of a device that was unplugged has no properties, no parent and no children.
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

  struct State {
    std::shared_ptr<FaultPlan> faults = std::make_shared<FaultPlan>();
    std::mutex mutex;  ///< Owns the rest.
    std::map<Device, Node> nodes{{root, {}}};
    Device last = root;
    int live = 0;
    bool readable = true;

    Node* find(Device device) {
      const auto found = nodes.find(device);
      return found == nodes.end() ? nullptr : &found->second;
    }

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
  [[nodiscard]] int liveEntries() const {
    const std::lock_guard lock(state_->mutex);
    return state_->live;
  }

  /// The entry of a device, as the registry would hand it out.
  [[nodiscard]] std::unique_ptr<RegistryEntry> entry(Device device) const {
    return std::make_unique<Entry>(state_, device);
  }

  std::optional<Entries> entriesMatchingProperty(std::string_view name,
                                                 const PropertyValue& value) override {
    if (faults->strikes()) return std::nullopt;
    std::vector<Device> matching;
    {
      const std::lock_guard lock(state_->mutex);
      if (!state_->readable) return std::nullopt;
      for (const auto& [device, node] : state_->nodes) {
        const PropertyValue* own = find(node.properties, name);
        if (own && *own == value) matching.push_back(device);
      }
    }
    return entriesOf(state_, matching);
  }

 private:
  // Shares the state, and so may outlive the registry.
  class Entry final : public RegistryEntry {
   public:
    Entry(std::shared_ptr<State> state, Device device) : state_(std::move(state)), device_(device) {
      const std::lock_guard lock(state_->mutex);
      ++state_->live;
    }
    ~Entry() override {
      const std::lock_guard lock(state_->mutex);
      --state_->live;
    }

    std::optional<PropertyValue> property(std::string_view name) const override {
      if (state_->faults->strikes()) return std::nullopt;
      const std::lock_guard lock(state_->mutex);
      const Node* node = state_->find(device_);
      const PropertyValue* value = node ? find(node->properties, name) : nullptr;
      return value ? std::optional(*value) : std::nullopt;
    }

    std::optional<PropertyDictionary> properties() const override {
      if (state_->faults->strikes()) return std::nullopt;
      const std::lock_guard lock(state_->mutex);
      const Node* node = state_->find(device_);
      if (!node || node->propertiesBroken) return std::nullopt;
      return node->properties;
    }

    std::unique_ptr<RegistryEntry> parent() const override {
      if (state_->faults->strikes()) return nullptr;
      Device parent = root;
      {
        const std::lock_guard lock(state_->mutex);
        const Node* node = state_->find(device_);
        if (device_ == root || !node || node->parentBroken) return nullptr;
        parent = node->parent;
      }
      return std::make_unique<Entry>(state_, parent);
    }

    DeviceRegistry::Entries children() const override {
      if (state_->faults->strikes()) return {};
      std::vector<Device> devices;
      {
        const std::lock_guard lock(state_->mutex);
        if (const Node* node = state_->find(device_)) devices = node->children;
      }
      return entriesOf(state_, devices);
    }

   private:
    const std::shared_ptr<State> state_;
    const Device device_;
  };

  static Entries entriesOf(const std::shared_ptr<State>& state,
                           const std::vector<Device>& devices) {
    Entries entries;
    for (const Device device : devices) entries.push_back(std::make_unique<Entry>(state, device));
    return entries;
  }
};

}  // namespace Varnel::Platform::Testing
