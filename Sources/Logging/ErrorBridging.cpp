// SPDX-License-Identifier: MIT
#include <Varnel/Logging/ErrorBridging.h>

#include <any>
#include <filesystem>
#include <functional>
#include <future>
#include <ios>
#include <memory>
#include <new>
#include <optional>
#include <regex>
#include <stdexcept>
#include <system_error>
#include <typeinfo>
#include <variant>

namespace Varnel {
namespace {

template <typename Type>
bool is(const std::exception& exception) {
  return dynamic_cast<const Type*>(&exception) != nullptr;
}

struct StandardType {
  bool (*matches)(const std::exception&);
  std::string_view name;
};

// Derived types before their bases: the first match is the nearest.
constexpr StandardType standardTypes[] = {
    {is<std::filesystem::filesystem_error>, "filesystem_error"},
    {is<std::ios_base::failure>, "failure"},
    {is<std::system_error>, "system_error"},
    {is<std::regex_error>, "regex_error"},
    {is<std::range_error>, "range_error"},
    {is<std::overflow_error>, "overflow_error"},
    {is<std::underflow_error>, "underflow_error"},
    {is<std::runtime_error>, "runtime_error"},
    {is<std::future_error>, "future_error"},
    {is<std::invalid_argument>, "invalid_argument"},
    {is<std::domain_error>, "domain_error"},
    {is<std::length_error>, "length_error"},
    {is<std::out_of_range>, "out_of_range"},
    {is<std::logic_error>, "logic_error"},
    {is<std::bad_array_new_length>, "bad_array_new_length"},
    {is<std::bad_alloc>, "bad_alloc"},
    {is<std::bad_any_cast>, "bad_any_cast"},
    {is<std::bad_cast>, "bad_cast"},
    {is<std::bad_typeid>, "bad_typeid"},
    {is<std::bad_exception>, "bad_exception"},
    {is<std::bad_function_call>, "bad_function_call"},
    {is<std::bad_optional_access>, "bad_optional_access"},
    {is<std::bad_variant_access>, "bad_variant_access"},
    {is<std::bad_weak_ptr>, "bad_weak_ptr"},
};

std::optional<std::error_code> codeOf(const std::exception& exception) {
  if (const auto* error = dynamic_cast<const std::system_error*>(&exception)) return error->code();
  if (const auto* error = dynamic_cast<const std::future_error*>(&exception)) return error->code();
  return std::nullopt;
}

}  // namespace

std::string_view standardTypeName(const std::exception& exception) {
  for (const StandardType& type : standardTypes)
    if (type.matches(exception)) return type.name;
  return "exception";
}

Platform::PlatformError platformError(const std::exception& exception) {
  Platform::ErrorUserInfo facts;
  facts.emplace(Platform::localizedDescriptionKey, std::string(exception.what()));
  if (const auto code = codeOf(exception))
    return {code->category().name(), code->value(), std::move(facts)};
  return {"std." + std::string(standardTypeName(exception)), 0, std::move(facts)};
}

std::string logDescription(const Platform::PlatformError& error) {
  return "NSError: " + error.description();
}

}  // namespace Varnel
