// SPDX-License-Identifier: MIT
// What a host without CMake writes: which product it is.
#include <Varnel/Context/Product.h>

extern "C" {
[[gnu::init_priority(101)]] Varnel::Product varnelProduct({.isSiteVersion = true,
                                                           .appName = "By hand",
                                                           .appDisplayVersion = "7",
                                                           .appArrangeVersion = "7.0"});
}
