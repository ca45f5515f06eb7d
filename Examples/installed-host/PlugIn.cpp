// SPDX-License-Identifier: MIT
// Uses the framework, and templates that the framework uses too.
#include <map>
#include <memory>
#include <string>

#include <Varnel/Context/Globals.h>

extern "C" const char* plugInName() {
  static std::map<std::string, std::shared_ptr<std::string>> names;
  names["plug-in"] = std::make_shared<std::string>(Varnel::Globals::applicationName());
  return names["plug-in"]->c_str();
}
