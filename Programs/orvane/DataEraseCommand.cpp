// SPDX-License-Identifier: MIT
#include <orvane/DataCommand.h>

#include <filesystem>
#include <set>

#include <orvane/Console.h>
#include <orvane/DataErasure.h>
#include <orvane/DataText.h>
#include <orvane/TrashCommand.h>

namespace Orvane {
namespace {

namespace fs = std::filesystem;

std::string plan(const std::vector<DataPart>& parts) {
  std::string text = textOf(parts);
  for (const DataPart& part : parts)
    if (part.name == "removals" && entriesOf(part).value_or(0) > 0)
      text += "what is in the trash stays there, but \"orvane restore\" will not know of it\n";
  return text + "nothing was erased yet: --yes does it\n";
}

std::string resultOf(const DataPart& part, const Erasure& erasure) {
  if (part.files.empty()) return part.name + ": none\n";
  if (erasure.left.empty()) return part.name + ": erased, " + sizeText(part.bytes()) + "\n";
  std::string text;
  for (const LeftFile& left : erasure.left)
    text += part.name + ": left " + pathText(left.path) + ": " + left.reason + "\n";
  return text;
}

}  // namespace

int DataEraseCommand::run(Console& console) const {
  const auto parts = productData();
  if (!erases) return console.writeResult(plan(parts)) ? 0 : 1;
  std::string text;
  std::set<std::string> folders;
  bool isAllGone = true;
  for (const DataPart& part : parts) {
    const Erasure erasure = erase(part);
    isAllGone = isAllGone && erasure.left.empty();
    text += resultOf(part, erasure);
    folders.insert(folderOf(part));
  }
  for (const std::string& folder : folders)
    if (std::error_code error; !fs::remove(folder, error) && error && isAllGone)
      text += "left " + pathText(folder) + ": it holds other files, or new ones\n";
  if (!console.writeResult(text)) return 1;
  return isAllGone ? 0 : someNotMoved;
}

}  // namespace Orvane
