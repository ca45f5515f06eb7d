// SPDX-License-Identifier: MIT
// The journal of removals. What was noted in a file, whatever it held, is found in it.
#include <algorithm>

#include <Fuzz/ForgedDatabase.h>
#include <Removal/RemovalJournal.h>
#include <Varnel/Platform/POSIX/Adapters.h>
#include <Varnel/Platform/Testing/CapturedOutput.h>

using namespace Orvane;
namespace Platform = Varnel::Platform;

static const auto files = Platform::POSIX::makePrivateFiles();

static void fuzz(std::string_view input) {
  Platform::Testing::CapturedSystemLog log;
  const Platform::Date now(std::chrono::hours(490'000));
  const Platform::TrashedFile file{.folder = "/home/ann/.local/share/Trash",
                                   .name = "a.jpg",
                                   .path = "/home/ann/a.jpg",
                                   .state = {1, 2, 3, 4, 5}};
  const auto remove = [&](const std::string& path) {
    RemovalJournal journal({*files, log}, path);
    const auto removal = journal.begin(now);
    return removal && !journal.note(*removal, file) ? std::optional(*removal) : std::nullopt;
  };
  static const ForgedDatabase database("removals.sqlite", [&](const std::string& path) {
    require(remove(path).has_value());
    ForgedDatabase::run(path, "PRAGMA wal_checkpoint(TRUNCATE)");
  });
  database.forge(input);
  RemovalJournal journal({*files, log}, database.path());
  if (const auto before = journal.removals())
    for (const RemovalRecord& removal : *before) static_cast<void>(journal.entries(removal));
  const auto removal = remove(database.path());
  if (!removal) return;
  const auto removals = journal.removals();
  require(removals && std::ranges::any_of(*removals, [&](const RemovalRecord& each) {
            return each.identifier == removal->identifier && each.files == 1;
          }));
  const auto entries = journal.entries(*removal);
  require(entries && entries->size() == 1 && entries->front().file == file);
}
