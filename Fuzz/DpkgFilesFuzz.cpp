// SPDX-License-Identifier: MIT
// The lists of a package, and of what it has put out of the way; a null character is between them.
#include <string>

#include <Fuzz/Fuzz.h>
#include <Removal/DpkgFiles.h>
#include <Tests/Support/TemporaryFolder.h>

static bool hasLine(std::string_view text, const std::string& line) {
  return ("\n" + std::string(text) + "\n").find("\n" + line + "\n") != std::string::npos;
}

static void fuzz(std::string_view input) {
  static const auto folder = Varnel::Tests::TemporaryFolder::inMemory();
  static const std::string absent = "/nowhere/in/the/world", device = "/dev/null";
  const auto [list, diversions] = cutAt('\0', input);
  folder.write("info/package.list", list);
  folder.write("info/package.md5sums", absent);
  folder.write("diversions", diversions);
  const auto owned = Orvane::DpkgFiles(folder.path()).among({absent, device});
  require(owned.hasValue());
  for (const std::string_view path : *owned) require(path == absent || path == device);
  require(owned->contains(absent) == (hasLine(list, absent) || hasLine(diversions, absent)));
}
