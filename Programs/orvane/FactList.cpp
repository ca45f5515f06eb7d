// SPDX-License-Identifier: MIT
#include <orvane/FactList.h>

#include <nlohmann/json.hpp>
#include <utility>

#include <Varnel/Platform/Text/VisibleText.h>
#include <orvane/JSONLine.h>

namespace Orvane {

using Varnel::Platform::visibleText;

void FactList::add(std::string key, std::string label, std::optional<std::string> value) {
  facts_.push_back({std::move(key), std::move(label), std::move(value)});
}

std::string FactList::text(Form form) const {
  std::string lines;
  nlohmann::ordered_json json = {{"schemaVersion", schemaVersion}};
  for (const Fact& fact : facts_) {
    lines += fact.label + ": " + (fact.value ? visibleText(*fact.value) : "none") + "\n";
    json[fact.key] = fact.value ? nlohmann::ordered_json(*fact.value) : nullptr;
  }
  return form == Form::lines ? lines : jsonLine(json);
}

}  // namespace Orvane
