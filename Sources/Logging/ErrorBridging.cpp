// SPDX-License-Identifier: MIT
#include <Varnel/Logging/ErrorBridging.h>

#include <future>
#include <ios>
#include <optional>
#include <system_error>
#include <typeinfo>
#include <utility>

#include <Varnel/Basalt/JSON.h>
#include <Varnel/Context/Globals.h>
#include <Varnel/Logging/Error.h>
#include <Varnel/Platform/Text/TypeName.h>

namespace Varnel {
namespace {

Platform::TypeName nameOf(const std::exception& exception) {
  const Platform::TypeName name = Platform::typeName(typeid(exception));
  // A stream may throw a class of the standard library's own, with a reserved name.
  const bool isStreams = name.name.starts_with("__") &&
                         dynamic_cast<const std::ios_base::failure*>(&exception) != nullptr;
  return isStreams ? Platform::typeName(typeid(std::ios_base::failure)) : name;
}

std::optional<std::error_code> codeOf(const std::exception& exception) {
  if (const auto* error = dynamic_cast<const std::system_error*>(&exception)) return error->code();
  if (const auto* error = dynamic_cast<const std::future_error*>(&exception)) return error->code();
  return std::nullopt;
}

// The exception that was being handled when this one was thrown, if it is nested in this one.
std::optional<Platform::PlatformError> underlyingError(const std::exception& exception) {
  const auto* nesting = dynamic_cast<const std::nested_exception*>(&exception);
  if (nesting == nullptr || nesting->nested_ptr() == nullptr) return std::nullopt;
  try {
    nesting->rethrow_nested();
  } catch (const Error& error) {
    return error.platformError();
  } catch (const Platform::PlatformError& error) {
    return error;
  } catch (const std::exception& error) {
    return platformError(error);
  } catch (...) {
    return std::nullopt;
  }
}

}  // namespace

std::string typeName(const std::exception& exception) {
  return nameOf(exception).name;
}

Platform::PlatformError platformError(const std::exception& exception) {
  if (const auto* error = dynamic_cast<const Error*>(&exception)) return error->platformError();
  Platform::ErrorUserInfo facts;
  facts.emplace(Platform::localizedDescriptionKey, std::string(exception.what()));
  if (auto underlying = underlyingError(exception))
    facts.emplace(Platform::underlyingErrorKey, *std::move(underlying));
  if (const auto code = codeOf(exception))
    return {code->category().name(), code->value(), std::move(facts)};
  if (const auto* error = dynamic_cast<const Basalt::JSONError*>(&exception))
    return {"Basalt.JSONError", static_cast<long>(error->kind()), std::move(facts)};
  const auto [space, name] = nameOf(exception);
  return {(space.empty() ? Globals::applicationName() : space) + "." + name, 0, std::move(facts)};
}

std::string logDescription(const Platform::PlatformError& error) {
  return "NSError: " + error.description();
}

}  // namespace Varnel
