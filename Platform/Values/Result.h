// SPDX-License-Identifier: MIT
#pragma once

#include <cassert>
#include <utility>
#include <variant>

#include <Varnel/Platform/Values/PlatformError.h>

namespace Varnel::Platform {

/// A value, or the error that stood in its way. Ports answer with it where absent and failed must
/// be told apart: `Result<std::optional<URL>>` has three answers.
///
///     if (auto volume = catalog.volumeURL(url)) use(*volume);
///     else report(volume.error());
///
/// A plain value; threads may share one as any other value.
template <typename Value, typename Error = PlatformError>
class [[nodiscard]] Result final {
 public:
  Result(Value value) : state_(std::in_place_index<0>, std::move(value)) {}
  Result(Error error) : state_(std::in_place_index<1>, std::move(error)) {}

  [[nodiscard]] bool hasValue() const { return state_.index() == 0; }
  explicit operator bool() const { return hasValue(); }

  /// The value. Calling it on a failure is a programming error.
  [[nodiscard]] Value& value() & {
    assert(hasValue());
    return *std::get_if<0>(&state_);
  }
  [[nodiscard]] const Value& value() const& {
    assert(hasValue());
    return *std::get_if<0>(&state_);
  }
  [[nodiscard]] Value&& value() && {
    assert(hasValue());
    return std::move(*std::get_if<0>(&state_));
  }
  /// The value, or `other` in place of the error.
  [[nodiscard]] Value valueOr(Value other) && {
    return hasValue() ? std::move(*this).value() : std::move(other);
  }
  [[nodiscard]] Value& operator*() & { return value(); }
  [[nodiscard]] const Value& operator*() const& { return value(); }
  [[nodiscard]] Value&& operator*() && { return std::move(*this).value(); }
  [[nodiscard]] Value* operator->() { return &value(); }
  [[nodiscard]] const Value* operator->() const { return &value(); }

  /// The error. Calling it on a success is a programming error.
  [[nodiscard]] const Error& error() const {
    assert(!hasValue());
    return *std::get_if<1>(&state_);
  }

 private:
  std::variant<Value, Error> state_;
};

}  // namespace Varnel::Platform
