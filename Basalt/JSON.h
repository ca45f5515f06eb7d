// SPDX-License-Identifier: MIT
#pragma once

#include <concepts>
#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

#include <Varnel/Platform/Api.h>
#include <Varnel/Platform/Values/PropertyValue.h>

namespace Basalt {

/// A JSON value. Objects are a `PropertyDictionary`, in the order of their keys, and lists a
/// `PropertyList`:
///
///     const JSON json = parseJSON(R"({"kind": "monthly"})");
///     if (const auto* object = json.as<PropertyDictionary>()) use(*object);
using JSON = Varnel::Platform::PropertyValue;

/// Why a text is not JSON, or why a JSON value could not become a value of some type. It is thrown
/// by constructors and functions that import JSON, and by nothing else.
class VARNEL_API JSONError final : public std::runtime_error {
 public:
  enum class Kind {
    typeMismatch,  ///< A value of the wrong type stands at `path()`.
    missingValue,  ///< Nothing stands at `path()`.
    message,       ///< The text or the value is refused for another reason; `what()` says why.
  };

  /// The value at `path` does not have the shape that `typeName` needs. The top value's path is
  /// "root".
  [[nodiscard]] static JSONError typeMismatch(std::string typeName, std::string path);
  [[nodiscard]] static JSONError missingValue(std::string typeName, std::string path);
  [[nodiscard]] static JSONError withMessage(const std::string& message);

  [[nodiscard]] Kind kind() const { return kind_; }
  [[nodiscard]] const std::string& typeName() const { return typeName_; }
  [[nodiscard]] const std::string& path() const { return path_; }

 private:
  JSONError(Kind kind, const std::string& text, std::string typeName, std::string path);

  Kind kind_;
  std::string typeName_;
  std::string path_;
};

/// The value that a JSON text in UTF-8 stands for. Throws `JSONError` of kind `message` for a text
/// that is not JSON, has something behind its value or numbers that no double holds, or is nested
/// more than 512 deep. Whole numbers that fit 64 bits with a sign are integers, all others
/// floating. If a key comes twice, the last one counts. The host's `setlocale` makes no difference.
/// Any thread.
[[nodiscard]] VARNEL_API JSON parseJSON(std::string_view text);

/// The value as a JSON text on one line, without an end of line, which `parseJSON` reads back.
/// Values that JSON cannot carry are replaced: bytes, dates and numbers that are not finite by
/// null, and bytes of a text or key that are not UTF-8 by U+FFFD. Any thread.
[[nodiscard]] VARNEL_API std::string jsonText(const JSON& json);

/// A type that can be made from a JSON value; its constructor throws `JSONError`.
template <typename Type>
concept JSONImportable = std::constructible_from<Type, const JSON&> && Type::canImportJSON;

/// A type that can be written as a JSON value.
template <typename Type>
concept JSONExportable = Type::canExportJSON && requires(const Type& value) {
  { value.exportJSON() } -> std::same_as<JSON>;
};

/// A type that goes both ways.
template <typename Type>
concept JSONConvertable = JSONImportable<Type> && JSONExportable<Type> && Type::canConvertJSON;

/// A type that can be made from a JSON object: a dictionary from strings to values. Its constructor
/// throws `JSONError`.
template <typename Type>
concept JSONObjectImportable = JSONImportable<Type> && Type::canImportJSONObject;

/// A type that can be written as a JSON object.
template <typename Type>
concept JSONObjectExportable = JSONExportable<Type> && requires(const Type& value) {
  { value.exportJSONObject() } -> std::same_as<JSON>;
};

/// A type that goes both ways as a JSON object.
template <typename Type>
concept JSONObjectConvertable =
    JSONObjectImportable<Type> && JSONObjectExportable<Type> && JSONConvertable<Type>;

/// The string under a key of a JSON object. Throws the type mismatch, naming `typeName`, when
/// `json` is no object (at "root") or the value is no string (at the key), and the missing value
/// when there is nothing under the key.
[[nodiscard]] VARNEL_API std::string importString(const JSON& json, std::string_view key,
                                                  std::string_view typeName);

/// The strings of a JSON list. Throws the type mismatch, naming `typeName` and "root", when `json`
/// is anything but a list of strings.
[[nodiscard]] VARNEL_API std::vector<std::string> importStrings(const JSON& json,
                                                                std::string_view typeName);

}  // namespace Basalt
