// SPDX-License-Identifier: MIT
#pragma once

#include <Tests/Contract/Contract.h>
#include <Varnel/Platform/Ports/ExtendedAttributes.h>

namespace Varnel::Platform::Contract {

/// One file, whose attributes a test sets.
class ExtendedAttributesWorld : public World {
 public:
  virtual ExtendedAttributes& attributes() = 0;
  virtual std::string path() = 0;
  virtual void set(const std::string& name, const std::string& value) = 0;
  /// A path to nothing, and a file that cannot have attributes.
  virtual std::string missingPath() = 0;
  virtual std::string pathWithoutAttributes() = 0;
};
using ExtendedAttributesContract = Suite<ExtendedAttributesWorld>;

}  // namespace Varnel::Platform::Contract
