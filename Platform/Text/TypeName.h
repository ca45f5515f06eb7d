// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <string_view>
#include <typeinfo>

namespace Varnel::Platform {

/// The two parts of a C++ type's name that a reader needs.
///
///     typeName(typeid(Host::Import::Failure));  // {"Host", "Failure"}
///
/// A plain value; the functions are for any thread.
struct TypeName {
  /// Empty where there is none. A class outside all namespaces counts as the namespace of the types
  /// inside it, because names do not tell the two apart.
  std::string outermostNamespace;
  std::string name;  ///< Without scope; a template's arguments are as the compiler writes them.

  bool operator==(const TypeName&) const = default;
};

[[nodiscard]] TypeName typeName(const std::type_info& type);

/// The parts of a name in full, "Host::run(int)::Failure": the form that the C++ runtime gives.
[[nodiscard]] TypeName typeName(std::string_view fullName);

}  // namespace Varnel::Platform
