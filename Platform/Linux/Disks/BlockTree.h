// SPDX-License-Identifier: MIT
#pragma once

#include <cstddef>
#include <optional>
#include <string>
#include <vector>

#include <Varnel/Platform/Values/PropertyValue.h>

namespace Varnel::Platform::Linux {

class BlockDevices;
class VirtioSerials;

/// Storage devices, the disks on them, the partitions on those, and the logical devices on any of
/// these, as they are at one moment. Nothing stands below itself.
struct BlockTree {
  struct Node {
    PropertyDictionary properties;
    std::optional<std::size_t> parent;  ///< The first parent; absent at the top.
    std::vector<std::size_t> children;
  };

  std::vector<Node> nodes;  ///< By the names of the devices; each storage device before its disk.
};

/// Reads the table of block devices.
[[nodiscard]] BlockTree readBlockTree(const BlockDevices& devices, VirtioSerials& virtioSerials);

}  // namespace Varnel::Platform::Linux
