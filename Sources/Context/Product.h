// SPDX-License-Identifier: MIT
#pragma once

#include <Varnel/Context/BuildSwitches.h>
#include <Varnel/Platform/Api.h>

namespace Varnel {

/// Declares which product a program is. The installed library belongs to none and serves the whole
/// suite; each program has one such object, in a source file of its own. CMake's `varnel_product`
/// writes that file; without it, it reads
///
///     #include <Varnel/Context/Product.h>
///
///     extern "C" {
///     [[gnu::init_priority(101)]] Varnel::Product varnelProduct(
///         {.isSiteVersion = true, .appName = "Fotovia 3", .appDisplayVersion = "3.1"});
///     }
///
/// The program's own start-up calls the constructor, so nothing need be exported. The linker looks
/// for the object by its name when the file lies in an archive. The priority constructs it before
/// the program's other objects. A product that names no channel stops the process at its first
/// question for one. The first declaration counts: another one that comes later, or after somebody
/// asked, changes nothing and is reported to the system's log.
class VARNEL_API Product final {
 public:
  explicit Product(const BuildSwitches& switches);
  Product(const Product&) = delete;
  Product& operator=(const Product&) = delete;
};

}  // namespace Varnel
