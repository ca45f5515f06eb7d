// SPDX-License-Identifier: MIT
// A program without anything.
#include <Benchmarks/StartUp/Memory.h>

int main(int argumentCount, char**) {
  return Benchmarks::end(argumentCount);
}
