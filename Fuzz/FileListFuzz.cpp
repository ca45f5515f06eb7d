// SPDX-License-Identifier: MIT
// A user's list of files; its first character says what is between two names.
#include <algorithm>

#include <Fuzz/Fuzz.h>
#include <Tests/Support/TemporaryFolder.h>
#include <orvane/FileList.h>

using namespace Orvane;

static void fuzz(std::string_view input) {
  static const auto folder = Varnel::Tests::TemporaryFolder::inMemory();
  const NameEnd end = input.starts_with('0') ? NameEnd::null : NameEnd::line;
  const std::string_view list = input.substr(std::min<std::size_t>(input.size(), 1));
  const auto files = readFileList(folder.write("list", list).string(), end);
  if (!files) return require(!files.error().empty());
  std::size_t count = 0;
  for (const auto& [path, names] : *files) {
    require(path.starts_with('/') && (path.size() == 1 || !path.ends_with('/')));
    for (const std::string& name : names)
      require(name.find_first_of({'/', static_cast<char>(end)}) == std::string::npos);
    count += names.size();
  }
  std::size_t expected = 0;
  for (std::size_t i = 0; i < list.size(); ++i)
    expected += list[i] != static_cast<char>(end) &&
                (i + 1 == list.size() || list[i + 1] == static_cast<char>(end));
  require(count == expected);
}
