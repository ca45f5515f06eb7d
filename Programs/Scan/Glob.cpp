// SPDX-License-Identifier: MIT
#include <Scan/Glob.h>

#include <fnmatch.h>
#include <locale.h>

#include <algorithm>
#include <cstring>

namespace Orvane {
namespace {

constexpr std::string_view anyFolders = "**";

/// Makes the calling thread take text for UTF-8, where the system can.
class TextIsUTF8 final {
 public:
  TextIsUTF8() : before_(::uselocale(utf8())) {}
  ~TextIsUTF8() { ::uselocale(before_); }
  TextIsUTF8(const TextIsUTF8&) = delete;
  TextIsUTF8& operator=(const TextIsUTF8&) = delete;

 private:
  // Without the locale there is none to be set.
  static locale_t utf8() {
    static const locale_t locale = ::newlocale(LC_CTYPE_MASK, "C.UTF-8", locale_t());
    return locale;
  }

  const locale_t before_;
};

bool matches(const std::string& step, const char* name) {
  const TextIsUTF8 text;
  return ::fnmatch(step.c_str(), name, 0) == 0;
}

}  // namespace

Glob::Glob(std::string_view pattern) : isForPaths_(pattern.find('/') != std::string_view::npos) {
  if (isForPaths_ && !pattern.starts_with('/')) steps_.emplace_back(anyFolders);
  if (pattern.starts_with('/')) pattern.remove_prefix(1);
  for (std::size_t end; (end = pattern.find('/')) != std::string_view::npos;) {
    steps_.emplace_back(pattern.substr(0, end));
    pattern.remove_prefix(end + 1);
  }
  steps_.emplace_back(isForPaths_ && pattern.empty() ? anyFolders : pattern);
}

bool Glob::matchesName(const std::string& name) const {
  return matches(steps_.front(), name.c_str());
}

// As `*` is matched within a name: what follows the last `**` is tried further and further on.
bool Glob::matchesPath(std::string path, Kind kind) const {
  std::replace(path.begin(), path.end(), '/', '\0');
  const char* name = path.c_str() + 1;
  const char* const end = path.c_str() + path.size() + 1;
  const auto next = [](const char* each) { return each + std::strlen(each) + 1; };

  auto step = steps_.begin();
  auto afterStars = step;
  const char* tried = nullptr;
  while (name != end) {
    if (step != steps_.end() && *step == anyFolders) {
      if (++step == steps_.end()) return true;
      afterStars = step;
      tried = name;
    } else if (step != steps_.end() && matches(*step, name)) {
      ++step;
      name = next(name);
    } else if (tried) {
      name = tried = next(tried);
      step = afterStars;
    } else {
      return false;
    }
  }
  if (kind == Kind::folder && step != steps_.end() && *step == anyFolders) ++step;
  return step == steps_.end();
}

}  // namespace Orvane
