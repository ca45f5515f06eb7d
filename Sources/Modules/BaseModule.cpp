// SPDX-License-Identifier: MIT
#include <Varnel/Modules/BaseModule.h>

#include <typeinfo>

#include <Varnel/Basalt/Assertions.h>
#include <Varnel/Basalt/Identifier.h>
#include <Varnel/Logging/Logger.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Ports/ProcessInfo.h>
#include <Varnel/Platform/Ports/UserLocale.h>

namespace Varnel {
namespace {

constexpr const char* undefined = "undefined";

}  // namespace

BaseModule::BaseModule() = default;
BaseModule::~BaseModule() = default;

std::string BaseModule::identifier() const {
  Basalt::QNAssertAbstract("BaseModule::identifier()");
  return {};
}

Bundle BaseModule::fetchBundle() const {
  Basalt::QNAssertAbstract("BaseModule::fetchBundle()");
  const Platform::Ports& ports = Platform::processPorts();
  // The description of a class lies in the image that the class was compiled into.
  return Bundle(ports.processInfo.get().bundleFolderOfCode(&typeid(*this), {}),
                ports.userLocale.get().languages());
}

std::optional<std::string> BaseModule::fetchVersion() const {
  const Bundle source = bundle();
  if (!source.infoDictionary()) return std::nullopt;
  const auto number = [&](std::string_view key) {
    return source.infoText(key).value_or(undefined);
  };
  return number("CFBundleShortVersionString") + " (" + number("CFBundleVersion") + "/" +
         number("QNSourceVersion") + ")";
}

std::string BaseModule::localizedString(std::string_view key,
                                        const std::optional<std::string>& tableName,
                                        std::string_view /*comment*/) const {
  return bundle().localizedString(key, {}, tableName);
}

std::string BaseModule::identifier(std::string_view suffix) const {
  return Basalt::identifier(identifier(), suffix);
}

std::string BaseModule::typeName() const {
  return "BaseModule";
}

Bundle BaseModule::bundle() const {
  const std::lock_guard lock(mutex_);
  if (!bundle_) bundle_ = fetchBundle();
  return *bundle_;
}

void BaseModule::setBundle(Bundle bundle) {
  const std::lock_guard lock(mutex_);
  bundle_ = std::move(bundle);
}

std::string BaseModule::version() const {
  {
    const std::lock_guard lock(mutex_);
    if (version_) return *version_;
  }
  // Asked outside the lock, because it reads the bundle through this object.
  std::string fetched = fetchVersion().value_or(undefined);
  const std::lock_guard lock(mutex_);
  if (!version_) version_ = std::move(fetched);
  return *version_;
}

void BaseModule::setVersion(std::string version) {
  const std::lock_guard lock(mutex_);
  version_ = std::move(version);
}

void BaseModule::logInitialization() const {
  std::call_once(initializationLogged_, [&] {
    Logger::instance().log("Initalizing module " + fetchVersion().value_or(undefined), typeName());
  });
}

}  // namespace Varnel
