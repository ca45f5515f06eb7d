// SPDX-License-Identifier: MIT
#include <orvane/DataCommand.h>

#include <nlohmann/json.hpp>
#include <optional>

#include <Varnel/Context/Globals.h>
#include <orvane/ClientIdentifier.h>
#include <orvane/Console.h>
#include <orvane/DataText.h>
#include <orvane/JSONLine.h>
#include <orvane/ProductData.h>

namespace Orvane {
namespace {

using nlohmann::ordered_json;

template <typename Value>
ordered_json orNull(const std::optional<Value>& value) {
  return value ? ordered_json(*value) : ordered_json();
}

ordered_json toJSON(const DataPart& part) {
  ordered_json files = ordered_json::array();
  for (const DataFile& file : part.files) files.push_back(file.path);
  return {{"name", part.name},
          {"path", part.path},
          {"bytes", part.bytes()},
          {"entries", orNull(entriesOf(part))},
          {"files", std::move(files)}};
}

}  // namespace

int DataShowCommand::run(Console& console) const {
  const auto parts = productData();
  if (!isJSON) return console.writeResult(textOf(parts)) ? 0 : 1;
  ordered_json object = {{"schemaVersion", schemaVersion},
                         {"product", Varnel::Globals::baseIdentifier()},
                         {"clientIdentifier", orNull(storedClientIdentifier())},
                         {"parts", ordered_json::array()}};
  for (const DataPart& part : parts) object["parts"].push_back(toJSON(part));
  return console.writeResult(jsonLine(object)) ? 0 : 1;
}

}  // namespace Orvane
