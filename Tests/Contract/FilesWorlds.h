// SPDX-License-Identifier: MIT
#pragma once

#include <Tests/Contract/Contract.h>
#include <Varnel/Platform/Ports/AppendFiles.h>
#include <Varnel/Platform/Ports/ExtendedAttributes.h>
#include <Varnel/Platform/Ports/PrivateFiles.h>
#include <Varnel/Platform/Ports/SecurityScope.h>

namespace Varnel::Platform::Contract {

/// A disk with a place for a file that does not exist yet.
class AppendFilesWorld : public WorldOf<AppendFiles> {
 public:
  virtual std::string path() = 0;
  /// What the file there holds.
  virtual std::string text() = 0;
  /// A file that opens, on a disk without room, and a place in a folder that does not exist.
  virtual std::string pathOnAFullDisk() = 0;
  virtual std::string pathInNoFolder() = 0;
};
using AppendFilesContract = Suite<AppendFilesWorld>;

/// One file, whose attributes a test sets.
class ExtendedAttributesWorld : public WorldOf<ExtendedAttributes> {
 public:
  virtual std::string path() = 0;
  virtual void set(const std::string& name, const std::string& value) = 0;
  /// A path to nothing, and a file that cannot have attributes.
  virtual std::string missingPath() = 0;
  virtual std::string pathWithoutAttributes() = 0;
};
using ExtendedAttributesContract = Suite<ExtendedAttributesWorld>;

/// The suite makes its files itself: a database opens them by their path.
using PrivateFilesContract = Suite<WorldOf<PrivateFiles>>;

/// A file, or a folder, that the process may read, and one that it may not.
class SecurityScopeWorld : public WorldOf<SecurityScope> {
 public:
  virtual URL readable(bool isFolder) = 0;
  virtual URL forbidden() = 0;
};
using SecurityScopeContract = Suite<SecurityScopeWorld>;

}  // namespace Varnel::Platform::Contract
