// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Text/TypeName.h>

#include <cxxabi.h>

#include <cctype>
#include <cstddef>
#include <cstdlib>
#include <memory>

namespace Varnel::Platform {
namespace {

bool isPartOfIdentifier(char c) {
  const auto byte = static_cast<unsigned char>(c);
  return std::isalnum(byte) || c == '_' || byte >= 0x80;
}

/// Where the last component begins. Scopes within brackets belong to arguments.
std::size_t startOfLastComponent(std::string_view name) {
  constexpr std::string_view operatorWord = "operator";
  std::size_t start = 0;
  int depth = 0;
  for (std::size_t i = 0; i < name.size(); ++i) {
    const char c = name[i];
    const bool startsWord = i == 0 || !isPartOfIdentifier(name[i - 1]);
    if (startsWord && name.substr(i).starts_with(operatorWord)) {
      // The signs of "operator<" and "operator->" are no brackets.
      i += operatorWord.size();
      while (i < name.size() && (name[i] == '<' || name[i] == '>' || name[i] == '-')) ++i;
      --i;
    } else if (c == '<' || c == '(' || c == '{' || c == '[') {
      ++depth;
    } else if (c == '>' || c == ')' || c == '}' || c == ']') {
      --depth;
    } else if (c == ':' && depth == 0) {
      start = i + 1;
    }
  }
  return start;
}

/// "Outer" of "Outer::Inner::Name". A function, the unnamed namespace or an instance of a template
/// does not count as a namespace.
std::string_view outermostNamespace(std::string_view name) {
  std::size_t length = 0;
  while (length < name.size() && isPartOfIdentifier(name[length])) ++length;
  const std::string_view first = name.substr(0, length);
  // The one function of C++ programs that shows without brackets.
  if (!name.substr(length).starts_with("::") || first == "main") return {};
  return first;
}

}  // namespace

TypeName typeName(const std::type_info& type) {
  int status = 0;
  const std::unique_ptr<char, decltype(&std::free)> fullName(
      abi::__cxa_demangle(type.name(), nullptr, nullptr, &status), &std::free);
  return typeName(std::string_view(fullName ? fullName.get() : type.name()));
}

TypeName typeName(std::string_view fullName) {
  const std::string_view scope = outermostNamespace(fullName);
  std::string_view name = fullName.substr(startOfLastComponent(fullName));
  // The library's own wrapper of what was thrown: "std::_Nested_exception<Host::Failure const>".
  if (scope == "std" && name.starts_with('_') && name.ends_with('>')) {
    name.remove_prefix(name.find('<') + 1);
    name.remove_suffix(name.ends_with(" >") ? 2 : 1);
    if (name.ends_with(" const")) name = name.substr(0, name.rfind(' '));
    return typeName(name);
  }
  // Marks of a binary interface: "failure[abi:cxx11]".
  while (name.ends_with(']') && name.find('[') != name.npos) name = name.substr(0, name.rfind('['));
  return {std::string(scope), std::string(name)};
}

}  // namespace Varnel::Platform
