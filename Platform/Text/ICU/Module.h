// SPDX-License-Identifier: MIT
#pragma once

namespace Varnel::Platform {
class LocaleLibrary;
}

/// The entry of the module of ICU. The library lives as long as the process.
extern "C" __attribute__((visibility("default"))) const Varnel::Platform::LocaleLibrary*
varnelLocaleLibrary();
