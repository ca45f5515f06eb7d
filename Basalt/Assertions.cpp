// SPDX-License-Identifier: MIT
#include <Varnel/Basalt/Assertions.h>

#include <cstdio>
#include <cstdlib>

#include <fmt/format.h>

namespace Basalt {
namespace {

// `fmt::print` would throw where standard error is closed or full, and the process would go on.
void tell(const std::string& line) {
  std::fputs(line.c_str(), stderr);
}

}  // namespace

void assertUnreachable(std::string_view file, int line) {
  tell(fmt::format("Unreachable code was reached at {}:{}\n", file, line));
  std::abort();
}

void QNAssertAbstract([[maybe_unused]] std::string_view operation) {
#ifndef NDEBUG
  tell(fmt::format("{} is abstract: a subclass must override it\n", operation));
  std::abort();
#endif
}

}  // namespace Basalt
