// SPDX-License-Identifier: MIT
#pragma once

#include <concepts>
#include <cstddef>
#include <memory>
#include <new>
#include <type_traits>
#include <utility>

namespace Basalt {

/// A piece of work to be done once, with everything that it needs: a function without arguments
/// that can be moved but not copied. A capture of up to four pointers costs no allocation.
///
///     Block block = [name = std::move(name)] { greet(name); };
///     block();
///
/// A plain value. Calling an empty block is a programming error.
class Block final {
 public:
  Block() = default;

  template <typename Function>
  requires(!std::same_as<std::remove_cvref_t<Function>, Block> &&
           std::invocable<std::decay_t<Function>&>) Block(Function&& function) {
    using Stored = std::decay_t<Function>;
    if constexpr (fits<Stored>) {
      new (storage_) Stored(std::forward<Function>(function));
      operations_ = &operationsOf<Stored>;
    } else {
      new (storage_) Boxed<Stored>{std::make_unique<Stored>(std::forward<Function>(function))};
      operations_ = &operationsOf<Boxed<Stored>>;
    }
  }

  Block(Block&& other) noexcept : operations_(std::exchange(other.operations_, nullptr)) {
    if (operations_) operations_->relocate(storage_, other.storage_);
  }
  Block& operator=(Block&& other) noexcept {
    if (this != &other) {
      std::destroy_at(this);
      new (this) Block(std::move(other));
    }
    return *this;
  }
  ~Block() {
    if (operations_) operations_->destroy(storage_);
  }

  void operator()() { operations_->call(storage_); }
  explicit operator bool() const { return operations_ != nullptr; }

 private:
  static constexpr std::size_t capacity = 4 * sizeof(void*);

  template <typename Function>
  static constexpr bool fits =
      sizeof(Function) <= capacity &&
      alignof(Function) <= alignof(void*) && std::is_nothrow_move_constructible_v<Function>;

  template <typename Function>
  struct Boxed {
    std::unique_ptr<Function> function;
    void operator()() { (*function)(); }
  };

  struct Operations {
    void (*call)(std::byte* storage);
    void (*relocate)(std::byte* to, std::byte* from) noexcept;
    void (*destroy)(std::byte* storage) noexcept;
  };

  template <typename Stored>
  static Stored& stored(std::byte* storage) {
    return *std::launder(reinterpret_cast<Stored*>(storage));
  }

  template <typename Stored>
  static constexpr Operations operationsOf{
      .call = [](std::byte* storage) { stored<Stored>(storage)(); },
      .relocate =
          [](std::byte* to, std::byte* from) noexcept {
            new (to) Stored(std::move(stored<Stored>(from)));
            std::destroy_at(&stored<Stored>(from));
          },
      .destroy = [](std::byte* storage) noexcept { std::destroy_at(&stored<Stored>(storage)); },
  };

  const Operations* operations_ = nullptr;
  alignas(void*) std::byte storage_[capacity];
};

}  // namespace Basalt
