// SPDX-License-Identifier: MIT
#include <orvane/DataText.h>

#include <algorithm>

#include <Varnel/Context/Globals.h>
#include <orvane/ClientIdentifier.h>
#include <orvane/ShownText.h>
#include <orvane/StoredRows.h>

namespace Orvane {
namespace {

std::string lineOf(const DataPart& part) {
  std::string text = part.name + ": ";
  if (part.files.empty()) {
    text += "none";
  } else {
    if (const auto entries = entriesOf(part))
      text += counted(static_cast<std::uint64_t>(*entries), "entry", "entries") + ", ";
    text += shownSize(part.bytes()) + " in " + shownPath(part.path);
  }
  text += "  (" + part.content + ")\n";
  for (const DataFile& file : part.files)
    if (file.objection) text += "  " + shownPath(file.path) + " " + *file.objection + "\n";
  return text;
}

}  // namespace

std::optional<std::int64_t> entriesOf(const DataPart& part) {
  if (part.form == DataPart::Form::text) return std::nullopt;
  if (part.form == DataPart::Form::logs)
    return std::count_if(part.files.begin(), part.files.end(),
                         [](const DataFile& file) { return !file.objection; });
  const auto main = std::find_if(part.files.begin(), part.files.end(),
                                 [&](const DataFile& file) { return file.path == part.path; });
  // One that is empty was made by a process that has kept nothing yet.
  if (main == part.files.end() || main->objection || main->bytes == 0) return std::nullopt;
  const auto count = countRows(part.path, part.table);
  return count ? std::optional(*count) : std::nullopt;
}

std::string textOf(const std::vector<DataPart>& parts) {
  std::string text = "product: " + Varnel::Globals::baseIdentifier() + "\n" +
                     "client identifier: " + storedClientIdentifier().value_or("none") + "\n";
  for (const DataPart& part : parts) text += lineOf(part);
  return text;
}

}  // namespace Orvane
