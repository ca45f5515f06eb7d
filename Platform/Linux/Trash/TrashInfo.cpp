// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Linux/Trash/TrashInfo.h>

#include <fmt/format.h>

#include <chrono>

#include <Varnel/Platform/Values/PercentEncoding.h>
#include <Varnel/Platform/Values/SystemText.h>
#include <Varnel/Platform/Values/UUID.h>

namespace Varnel::Platform::Linux {
namespace {

constexpr std::string_view header = "[Trash Info]";
constexpr std::string_view pathKey = "Path=";

// From here on nobody counts any more: several programs may be after the same names.
constexpr unsigned firstRandomAttempt = 8;

constexpr bool isContinuation(char byte) {
  return (static_cast<unsigned char>(byte) & 0xC0) == 0x80;
}

}  // namespace

std::string trashInfoText(std::string_view path, Date deleted) {
  using namespace std::chrono;
  const auto day = floor<days>(deleted);
  const year_month_day date(day);
  const hh_mm_ss time(floor<seconds>(deleted - day));
  std::string text = std::string(header) + "\n" + std::string(pathKey);
  appendPercentEncoded(text, path, pathBytes);
  return text + fmt::format("\nDeletionDate={:04}-{:02}-{:02}T{:02}:{:02}:{:02}\n",
                            static_cast<int>(date.year()), static_cast<unsigned>(date.month()),
                            static_cast<unsigned>(date.day()), time.hours().count(),
                            time.minutes().count(), time.seconds().count());
}

std::optional<std::string> pathInTrashInfo(std::string_view text) {
  bool isHeaded = false;
  while (!text.empty()) {
    const std::size_t end = text.find('\n');
    const std::string_view line = text.substr(0, end);
    text.remove_prefix(end == std::string_view::npos ? text.size() : end + 1);
    if (line == header) isHeaded = true;
    if (!isHeaded || !line.starts_with(pathKey)) continue;
    std::string path = percentDecoded(line.substr(pathKey.size()));
    if (path.empty() || isCutShort(path)) return std::nullopt;
    return path;
  }
  return std::nullopt;
}

std::string nameInTrash(std::string_view name, unsigned attempt, std::size_t maxName) {
  std::string ending;
  if (attempt > 0)
    ending =
        attempt < firstRandomAttempt ? fmt::format(".{}", attempt + 1) : "." + randomUUIDString();
  const std::size_t taken = ending.size() + trashInfoEnding.size();
  std::size_t room = maxName > taken ? maxName - taken : 1;
  if (name.size() <= room) return std::string(name) + ending;
  // A character is not cut into halves, unless the name is no text anyway.
  const std::size_t cut = room;
  while (room > 0 && cut - room < 4 && isContinuation(name[room])) --room;
  if (room == 0 || isContinuation(name[room])) room = cut;
  return std::string(name.substr(0, room)) + ending;
}

}  // namespace Varnel::Platform::Linux
