// SPDX-License-Identifier: MIT
// A host that asks who it is, for which the framework makes its services.
#include <Benchmarks/StartUp/Memory.h>
#include <Varnel/Context/Globals.h>

int main(int argumentCount, char**) {
  if (Varnel::Globals::applicationVersionString().empty()) return 1;
  return Benchmarks::end(argumentCount);
}
