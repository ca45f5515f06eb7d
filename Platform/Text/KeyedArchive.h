// SPDX-License-Identifier: MIT
#pragma once

#include <optional>
#include <string>
#include <string_view>

#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/PropertyValue.h>
#include <Varnel/Platform/Values/URL.h>

namespace Varnel::Platform {

/// Puts the parts of an object into an archive, each under a key. The archive is an XML property
/// list: a dictionary with those keys. One thread at a time.
///
///     KeyedArchiver archiver;
///     archiver.encode("homeURL", home);
///     const std::string bytes = archiver.bytes();
class VARNEL_API KeyedArchiver final {
 public:
  /// Keys are ASCII names of the program's own.
  void encode(std::string key, const URL& fileURL);

  /// The archive of all that was encoded so far.
  [[nodiscard]] std::string bytes() const;

 private:
  PropertyDictionary values_;
};

/// Takes the parts out of an archive again. A value is given out only if it is of the requested
/// kind, so foreign or damaged bytes do no harm. Any thread.
class VARNEL_API KeyedUnarchiver final {
 public:
  /// Absent when the bytes are no archive.
  [[nodiscard]] static std::optional<KeyedUnarchiver> open(std::string_view bytes);

  /// The file URL under `key`; absent when there is none.
  [[nodiscard]] std::optional<URL> decodeURL(std::string_view key) const;

 private:
  explicit KeyedUnarchiver(PropertyDictionary values) : values_(std::move(values)) {}

  PropertyDictionary values_;
};

}  // namespace Varnel::Platform
