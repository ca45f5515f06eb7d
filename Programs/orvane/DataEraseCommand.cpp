// SPDX-License-Identifier: MIT
#include <orvane/DataCommand.h>

#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <optional>
#include <set>
#include <system_error>

#include <orvane/Console.h>
#include <orvane/DataErasure.h>
#include <orvane/DataText.h>
#include <orvane/ShownText.h>
#include <orvane/TrashCommand.h>

namespace Orvane {
namespace {

std::string plan(const std::vector<DataPart>& parts) {
  std::string text = textOf(parts);
  for (const DataPart& part : parts)
    if (part.name == "removals" && entriesOf(part).value_or(0) > 0)
      text += "what is in the trash stays there, but \"orvane restore\" will not know of it\n";
  return text + "nothing was erased yet: --yes does it\n";
}

std::string resultOf(const DataPart& part, const Erasure& erasure) {
  if (part.files.empty()) return part.name + ": none\n";
  if (erasure.left.empty()) return part.name + ": erased, " + shownSize(part.bytes()) + "\n";
  std::string text;
  for (const LeftFile& left : erasure.left)
    text += part.name + ": left " + shownPath(left.path) + ": " + left.reason + "\n";
  return text;
}

// Root may be in the home of somebody else, and be let.
bool isOthers(const std::string& folder) {
  struct stat facts {};
  return ::lstat(folder.c_str(), &facts) == 0 && facts.st_uid != ::geteuid();
}

// Unlike other ways to remove, this one takes no file or link that is in the folder's place.
std::optional<std::string> removeFolder(const std::string& folder) {
  if (isOthers(folder)) return "it belongs to somebody else";
  if (::rmdir(folder.c_str()) == 0 || errno == ENOENT) return std::nullopt;
  if (errno == ENOTDIR) return "it is no folder, but a file or a link";
  if (errno == ENOTEMPTY || errno == EEXIST) return "it holds other files, or new ones";
  return std::generic_category().message(errno);
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
    if (const auto reason = removeFolder(folder); reason && isAllGone)
      text += "left " + shownPath(folder) + ": " + *reason + "\n";
  if (!console.writeResult(text)) return 1;
  return isAllGone ? 0 : someNotMoved;
}

}  // namespace Orvane
