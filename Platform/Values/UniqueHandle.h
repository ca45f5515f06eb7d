// SPDX-License-Identifier: MIT
#pragma once

#include <utility>

namespace Varnel::Platform {

/// Owns a foreign object that is released by a plain function, `Release(handle)`.
///
///     using Text = UniqueHandle<char*, g_free>;
template <typename Handle, auto Release>
class UniqueHandle final {
 public:
  UniqueHandle() = default;
  explicit UniqueHandle(Handle handle) : handle_(handle) {}
  UniqueHandle(UniqueHandle&& other) noexcept : handle_(std::exchange(other.handle_, Handle())) {}
  UniqueHandle& operator=(UniqueHandle&& other) noexcept {
    std::swap(handle_, other.handle_);
    return *this;
  }
  ~UniqueHandle() {
    if (handle_) Release(handle_);
  }

  [[nodiscard]] Handle get() const { return handle_; }
  /// Gives the object away.
  [[nodiscard]] Handle release() { return std::exchange(handle_, Handle()); }
  explicit operator bool() const { return static_cast<bool>(handle_); }

 private:
  Handle handle_{};
};

}  // namespace Varnel::Platform
