// SPDX-License-Identifier: MIT
#pragma once

#include <map>
#include <memory>
#include <optional>
#include <string>
#include <utility>

#include <Varnel/Platform/Ports/ExtendedAttributes.h>
#include <Varnel/Platform/Testing/FaultPlan.h>
#include <Varnel/Platform/Values/SystemText.h>

namespace Varnel::Platform::Testing {

/// Attributes that the test hangs on paths; every other path is a file without any. Set them before
/// other threads read.
///
///     attributes.values[{"/opt/orvane", "com.apple.quarantine"}] = "0083;5f;Browser;E1";
class FakeExtendedAttributes final : public ExtendedAttributes {
 public:
  /// Readings. One that goes wrong fails, or finds no attribute.
  std::shared_ptr<FaultPlan> faults = std::make_shared<FaultPlan>();
  std::map<std::pair<std::string, std::string>, std::string> values;  ///< By path and name.
  std::error_code error;  ///< What every reading fails with, if anything.

  [[nodiscard]] Result<std::optional<std::string>, std::error_code> value(
      const std::string& path, const std::string& name) override {
    if (name.empty() || isCutShort(name) || isCutShort(path))
      return std::make_error_code(std::errc::invalid_argument);
    if (error) return error;
    const Fault fault = faults->nextInTime();
    if (fault == Fault::fails) return std::make_error_code(std::errc::io_error);
    if (fault == Fault::absent) return std::optional<std::string>();
    const auto found = values.find({path, name});
    if (found == values.end()) return std::optional<std::string>();
    return std::optional(found->second);
  }
};

}  // namespace Varnel::Platform::Testing
