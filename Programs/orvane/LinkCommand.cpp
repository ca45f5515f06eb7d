// SPDX-License-Identifier: MIT
#include <orvane/LinkCommand.h>

#include <map>
#include <memory>

#include <Varnel/Identification/Links/TDSService.h>
#include <Varnel/Identification/User/UserIdentificationInfo.h>
#include <Varnel/Identification/User/UserIdentificator.h>
#include <orvane/Console.h>

namespace Orvane {
namespace {

using Varnel::Platform::URL;

constexpr int wrongArguments = 2;

std::optional<std::map<std::string, std::string>> parametersOf(
    const std::vector<std::string>& words, Console& console) {
  std::map<std::string, std::string> parameters;
  for (const std::string& word : words) {
    const std::size_t mark = word.find('=');
    if (mark == std::string::npos || mark == 0) {
      console.complain("\"" + word + "\" is not of the form KEY=VALUE");
      return std::nullopt;
    }
    if (!parameters.emplace(word.substr(0, mark), word.substr(mark + 1)).second) {
      console.complain("\"" + word.substr(0, mark) + "\" is given twice");
      return std::nullopt;
    }
  }
  return parameters;
}

}  // namespace

int LinkCommand::run(Console& console) const {
  const Varnel::TDSService service(std::make_shared<Varnel::TDSConfiguration>("Orvane", "orvane2"),
                                   std::make_shared<Varnel::UserIdentificationInfo>(
                                       std::make_shared<Varnel::UserIdentificator>()));
  std::optional<URL> link;
  if (action) {
    const auto parameters = parametersOf(words, console);
    if (!parameters) return wrongArguments;
    link = service.buildURL(*action, *parameters);
  } else if (words.size() != 1) {
    console.complain("link takes one URL, or --action and parameters");
    return wrongArguments;
  } else if (const auto url = URL::parse(words.front())) {
    link = service.prepareUrl(*url);
  } else {
    console.complain("\"" + words.front() + "\" is no URL");
    return wrongArguments;
  }
  if (!link) {
    console.complain("there is no such link");
    return 1;
  }
  return console.writeResult(link->absoluteString() + "\n") ? 0 : 1;
}

}  // namespace Orvane
