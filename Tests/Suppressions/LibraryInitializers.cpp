// SPDX-License-Identifier: MIT
// For test programs that use GLib heavily. Its initializer makes a table of names that it abandons
// on purpose once the table has to grow, since other threads may still read it. To tell that
// initializer from our own calls of GLib the sanitizer has to see whole stacks.
#include <Platform/Api.h>

extern "C" VARNEL_API const char* __asan_default_options() {
  return "fast_unwind_on_malloc=0";
}

extern "C" VARNEL_API const char* __lsan_default_suppressions() {
  return "leak:_dl_init\n";
}
