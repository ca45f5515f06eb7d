// SPDX-License-Identifier: MIT
#include <orvane/MenuCommand.h>

#include <string>

#include <Varnel/Interface/MainMenuAccessibility.h>
#include <orvane/Console.h>

namespace Orvane {

int MenuCommand::run(Console& console) const {
  std::string text;
  for (const std::string& identifier : Varnel::MainMenuAccessibility::instance().identifiers())
    text += identifier + "\n";
  return console.writeResult(text) ? 0 : 1;
}

}  // namespace Orvane
