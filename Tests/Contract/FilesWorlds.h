// SPDX-License-Identifier: MIT
#pragma once

#include <Tests/Contract/Contract.h>
#include <Varnel/Platform/Ports/AppendFiles.h>
#include <Varnel/Platform/Ports/ExtendedAttributes.h>
#include <Varnel/Platform/Ports/PrivateFiles.h>
#include <Varnel/Platform/Ports/SecurityScope.h>
#include <Varnel/Platform/Ports/Trash.h>

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

/// A disk with a trash, and a folder on it.
class TrashWorld : public WorldOf<Trash> {
 public:
  virtual std::string folder() = 0;
  /// Makes a file, and its folder, with so many bytes; each is another than all before.
  virtual void write(const std::string& path, std::size_t size) = 0;
  virtual bool exists(const std::string& path) = 0;
  /// The folder goes, with all that is in it.
  virtual void remove(const std::string& folder) = 0;
  /// What another program does.
  virtual void empty(const TrashedFile& file) = 0;
  /// A file on a disk that has no trash.
  virtual std::string pathWithoutTrash() = 0;
};
using TrashContract = Suite<TrashWorld>;

}  // namespace Varnel::Platform::Contract
