// SPDX-License-Identifier: MIT
// Loads the plug-in, asks it and unloads it. Fails when the plug-in stays.
#include <dlfcn.h>

#include <cstdio>

int main(int, char** arguments) {
  void* plugIn = dlopen(arguments[1], RTLD_NOW | RTLD_LOCAL);
  if (!plugIn) return std::puts(dlerror()), 1;
  using Name = const char* (*)();
  std::puts(reinterpret_cast<Name>(dlsym(plugIn, "plugInName"))());
  dlclose(plugIn);
  return dlopen(arguments[1], RTLD_NOW | RTLD_NOLOAD) ? 2 : 0;
}
