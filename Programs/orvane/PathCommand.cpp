// SPDX-License-Identifier: MIT
#include <orvane/PathCommand.h>

#include <Varnel/Paths/QNURLResolver.h>
#include <Varnel/Platform/Text/VisibleText.h>
#include <orvane/Console.h>

namespace Orvane {

using Varnel::Platform::visibleText;

int PathCommand::run(Console& console) const {
  const auto& resolver = Varnel::QNURLResolver::shared();
  std::string text;
  for (const std::string& path : paths) {
    const std::string shown = expands ? resolver.expandedPathForPath(path).value_or(path)
                                      : resolver.abbreviatedPath(path);
    text += visibleText(shown) + "\n";
  }
  return console.writeResult(text) ? 0 : 1;
}

}  // namespace Orvane
