// SPDX-License-Identifier: MIT
#pragma once

#include <cstdio>

namespace Benchmarks {

/// Prints what the process occupies when it was given an argument, by the means of a bare host.
inline int end(int argumentCount) {
  if (argumentCount < 2) return 0;
  std::FILE* const facts = std::fopen("/proc/self/smaps_rollup", "r");
  char line[256];
  while (facts && std::fgets(line, sizeof line, facts)) std::fputs(line, stdout);
  return facts ? std::fclose(facts) : 1;
}

}  // namespace Benchmarks
