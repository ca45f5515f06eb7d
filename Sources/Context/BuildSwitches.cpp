// SPDX-License-Identifier: MIT
#include <Varnel/Context/BuildSwitches.h>

#include <atomic>
#include <filesystem>
#include <string_view>

#include <Varnel/Context/Product.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Ports/ProcessInfo.h>
#include <Varnel/Platform/Ports/SystemLog.h>

namespace {

const Varnel::BuildSwitches& product() {
  return Varnel::BuildSwitches::ofThisProduct();
}

}  // namespace

bool QNIsAppStoreVersion() {
  return product().isAppStoreVersion;
}
bool QNIsSiteVersion() {
  return product().isSiteVersion;
}
bool QNIsMarkettaVersion() {
  return product().isMarkettaVersion;
}
bool QNIsPrivateBetaMode() {
  return product().isPrivateBetaMode;
}
bool QNIsDebugMode() {
  return product().isDebugMode;
}
const char* QNAppName() {
  return product().appName.c_str();
}
const char* QNAppDisplayVersion() {
  return product().appDisplayVersion.c_str();
}
const char* QNAppArrangeVersion() {
  return product().appArrangeVersion.c_str();
}

namespace Varnel {
namespace {

// Set once, by the product or by the first reader, whichever comes first; never freed.
constinit std::atomic<const BuildSwitches*> chosen = nullptr;

const BuildSwitches& choose(const BuildSwitches* candidate) {
  const BuildSwitches* earlier = nullptr;
  if (chosen.compare_exchange_strong(earlier, candidate)) return *candidate;
  delete candidate;
  return *earlier;
}

BuildSwitches undeclared() {
  const std::filesystem::path executable =
      Platform::processPorts().processInfo.get().executablePath();
  return {.isSiteVersion = true, .appName = executable.filename().string()};
}

}  // namespace

const BuildSwitches& BuildSwitches::ofThisProduct() {
  if (const BuildSwitches* switches = chosen.load()) return *switches;
  return choose(new BuildSwitches(undeclared()));
}

Product::Product(const BuildSwitches& switches) {
  // A plug-in may bring along the declaration that its program has made already.
  if (choose(new BuildSwitches(switches)) == switches) return;
  Platform::processPorts().systemLog.get().write(
      "A product was declared after another one, or after its facts had been asked for; it does "
      "not count.");
}

}  // namespace Varnel
