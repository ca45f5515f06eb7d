// SPDX-License-Identifier: MIT
// What lies beside a file in the trash, and the names that files get there.
#include <Fuzz/Fuzz.h>
#include <Varnel/Platform/Linux/Trash/TrashInfo.h>

using namespace Varnel::Platform;

static void fuzz(std::string_view input) {
  if (const auto path = Linux::pathInTrashInfo(input))
    require(Linux::pathInTrashInfo(Linux::trashInfoText(*path, Date())) == path);
  const auto [name, rest] = cutAt('/', input);
  const std::size_t maxName = 80 + rest.size() % 200;
  for (const unsigned attempt : {0u, 1u, 9u})
    require(Linux::nameInTrash(name, attempt, maxName).size() + Linux::trashInfoEnding.size() <=
            maxName);
}
