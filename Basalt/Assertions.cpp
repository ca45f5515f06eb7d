// SPDX-License-Identifier: MIT
#include <Varnel/Basalt/Assertions.h>

#include <cstdio>
#include <cstdlib>

#include <fmt/format.h>

namespace Basalt {

void assertUnreachable(std::string_view file, int line) {
  fmt::print(stderr, "Unreachable code was reached at {}:{}\n", file, line);
  std::abort();
}

void QNAssertAbstract([[maybe_unused]] std::string_view operation) {
#ifndef NDEBUG
  fmt::print(stderr, "{} is abstract: a subclass must override it\n", operation);
  std::abort();
#endif
}

}  // namespace Basalt
