// SPDX-License-Identifier: MIT
#include <Varnel/Modules/VarnelModule.h>

#include <mutex>
#include <typeinfo>

#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Ports/ProcessInfo.h>
#include <Varnel/Platform/Ports/UserLocale.h>

namespace Varnel {
namespace {

struct SharedModule {
  std::mutex mutex;  // Owns `module`.
  std::shared_ptr<VarnelModule> module;
};

SharedModule& sharedModule() {
  static SharedModule& shared = *new SharedModule();
  return shared;
}

}  // namespace

VarnelModule::VarnelModule() {
  logInitialization();
}

std::shared_ptr<VarnelModule> VarnelModule::instance() {
  SharedModule& shared = sharedModule();
  const std::lock_guard lock(shared.mutex);
  if (!shared.module) shared.module = std::make_shared<VarnelModule>();
  return shared.module;
}

void VarnelModule::setInstance(std::shared_ptr<VarnelModule> instance) {
  SharedModule& shared = sharedModule();
  const std::lock_guard lock(shared.mutex);
  shared.module = std::move(instance);
}

std::string VarnelModule::identifier() const {
  return "varnel-module";
}

Bundle VarnelModule::fetchBundle() const {
  const Platform::Ports& ports = Platform::processPorts();
  return Bundle(
      ports.processInfo.get().bundleFolderOfCode(&typeid(VarnelModule), VARNEL_BUNDLE_FOLDER),
      ports.userLocale.get().languages());
}

std::string VarnelModule::typeName() const {
  return "VarnelModule";
}

}  // namespace Varnel
