// SPDX-License-Identifier: MIT
#include <orvane/ProductData.h>

#include <algorithm>
#include <array>
#include <filesystem>
#include <string_view>

#include <Removal/RemovalJournal.h>
#include <Varnel/Context/ApplicationData.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Ports/PrivateFiles.h>

namespace Orvane {
namespace {

namespace fs = std::filesystem;

// A file comes first, then what nobody must take for another file's: its journals, and what was set
// aside or half written. Locks come last.
constexpr std::array<std::string_view, 4> contents = {"", ".salvage", ".damaged", ".new"};
constexpr std::array<std::string_view, 4> journals = {"", "-journal", "-wal", "-shm"};
constexpr std::array<std::string_view, 4> locks = {".deliverer", ".removing", ".lock", ".opening"};

std::optional<DataFile> fileAt(const fs::path& path) {
  std::error_code error;
  const fs::file_status status = fs::symlink_status(path, error);
  if (!fs::exists(status)) return std::nullopt;
  DataFile file{.path = path};
  if (fs::is_symlink(status)) {
    file.objection = "is a link";
  } else if (!fs::is_regular_file(status)) {
    file.objection = "is no regular file";
  } else if (const auto size = fs::file_size(path, error); !error) {
    file.bytes = size;
  }
  return file;
}

// "2026-03-14.log"
bool isLogName(const std::string& name) {
  constexpr std::string_view pattern = "0000-00-00.log";
  return std::equal(name.begin(), name.end(), pattern.begin(), pattern.end(),
                    [](char c, char p) { return p == '0' ? c >= '0' && c <= '9' : c == p; });
}

// A folder that is a link may be anybody's, and so may the files in it.
std::vector<DataFile> logsIn(const fs::path& folder) {
  std::vector<DataFile> found;
  std::error_code error;
  const fs::file_status status = fs::symlink_status(folder, error);
  if (!fs::exists(status)) return found;
  if (!fs::is_directory(status))
    return {{.path = folder, .objection = fs::is_symlink(status) ? "is a link" : "is no folder"}};
  for (fs::directory_iterator each(folder, error), end; !error && each != end;
       each.increment(error))
    if (isLogName(each->path().filename()))
      if (auto file = fileAt(each->path())) found.push_back(*std::move(file));
  std::sort(found.begin(), found.end(),
            [](const DataFile& a, const DataFile& b) { return a.path < b.path; });
  return found;
}

}  // namespace

std::uint64_t DataPart::bytes() const {
  std::uint64_t sum = 0;
  for (const DataFile& file : files) sum += file.bytes;
  return sum;
}

std::string folderOf(const DataPart& part) {
  return part.form == DataPart::Form::logs ? part.path : fs::path(part.path).parent_path().string();
}

std::vector<DataFile> filesOf(const DataPart& part) {
  if (part.form == DataPart::Form::logs) return logsIn(part.path);
  std::vector<DataFile> found;
  const auto look = [&](std::string_view suffix, std::string_view more) {
    if (auto file = fileAt(part.path + std::string(suffix) + std::string(more)))
      found.push_back(*std::move(file));
  };
  for (const auto file : contents)
    for (const auto journal : journals) look(file, journal);
  for (const auto lock : locks) look(lock, {});
  return found;
}

std::optional<std::string> removeFile(const DataFile& file) {
  if (file.objection) return file.objection;
  // Root may be in the home of somebody else.
  Varnel::Platform::PrivateFiles& files = Varnel::Platform::processPorts().privateFiles;
  if (const auto path = files.prepare(file.path); !path) return path.error().localizedDescription();
  const std::error_code failure = files.remove(file.path);
  return failure ? std::optional(failure.message()) : std::nullopt;
}

bool hasContent(const DataFile& file) {
  const auto endsWith = [&](std::string_view suffix) {
    return !suffix.empty() && file.path.ends_with(suffix);
  };
  return std::none_of(journals.begin(), journals.end(), endsWith) &&
         std::none_of(locks.begin(), locks.end(), endsWith);
}

std::vector<DataFile> productLogs() {
  return logsIn(Varnel::ApplicationData::logFolder());
}

std::vector<DataPart> productData() {
  using enum DataPart::Form;
  using Varnel::ApplicationData;
  const std::string events = ApplicationData::analyticsSpoolPath();
  const fs::path state = fs::path(events).parent_path();
  std::vector<DataPart> parts = {{.name = "settings",
                                  .content = "answers and choices",
                                  .form = text,
                                  .path = ApplicationData::settingsPath()},
                                 {.name = "events",
                                  .content = "events that have not been sent",
                                  .form = database,
                                  .path = events,
                                  .table = "event",
                                  .lock = ".deliverer"},
                                 {.name = "removals",
                                  .content = "what was moved to the trash",
                                  .form = database,
                                  .path = RemovalJournal::productPath(),
                                  .table = "files",
                                  .lock = ".removing"},
                                 {.name = "reminders",
                                  .content = "reminders, planned and delivered",
                                  .form = database,
                                  .path = state / "notifications.sqlite",
                                  .table = "deliveries",
                                  .lock = ".deliverer"},
                                 {.name = "logs",
                                  .content = "what was done when",
                                  .form = logs,
                                  .path = ApplicationData::logFolder()}};
  for (DataPart& part : parts) part.files = filesOf(part);
  return parts;
}

}  // namespace Orvane
