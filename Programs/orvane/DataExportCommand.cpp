// SPDX-License-Identifier: MIT
#include <orvane/DataCommand.h>

#include <fstream>
#include <iterator>
#include <nlohmann/json.hpp>

#include <Varnel/Context/Globals.h>
#include <orvane/Console.h>
#include <orvane/JSONLine.h>
#include <orvane/ProductData.h>
#include <orvane/StoredRows.h>

namespace Orvane {
namespace {

using nlohmann::ordered_json;

/// A file with what is in it, or with why that cannot be told.
ordered_json toJSON(const DataFile& file, DataPart::Form form) {
  ordered_json object;
  addPath(object, "path", "url", file.path);
  object["bytes"] = file.bytes;
  if (file.objection) {
    object["notRead"] = *file.objection;
  } else if (!hasContent(file) || file.bytes == 0) {
    return object;
  } else if (form == DataPart::Form::database) {
    auto rows = readRows(file.path);
    if (rows) {
      object["tables"] = *std::move(rows);
    } else {
      object["notRead"] = rows.error().localizedDescription();
    }
  } else if (std::ifstream stream(file.path, std::ios::binary); stream) {
    addText(object, "text", std::string(std::istreambuf_iterator<char>(stream), {}));
  } else {
    object["notRead"] = "cannot be opened";
  }
  return object;
}

}  // namespace

// A file at a time: years of a journal, or a month of logs, need not fit into memory.
int DataExportCommand::run(Console& console) const {
  bool isWritten = true;
  const auto write = [&](const std::string& text) {
    isWritten = isWritten && console.writeResult(text);
  };
  write("{\"schemaVersion\":" + std::to_string(schemaVersion) +
        ",\"product\":" + jsonText(Varnel::Globals::baseIdentifier()));
  for (const DataPart& part : productData()) {
    write("," + jsonText(part.name) + ":[");
    std::string comma;
    for (const DataFile& file : part.files) {
      if (!isWritten) return 1;
      write(comma + jsonText(toJSON(file, part.form)));
      comma = ",";
    }
    write("]");
  }
  write("}\n");
  return isWritten ? 0 : 1;
}

}  // namespace Orvane
