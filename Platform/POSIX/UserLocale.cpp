// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Ports/UserLocale.h>

#include <cstdlib>
#include <initializer_list>
#include <memory>
#include <string_view>

#include <Varnel/Platform/POSIX/Adapters.h>

namespace Varnel::Platform::POSIX {
namespace {

constexpr std::string_view fallbackIdentifier = "en_US";

std::string_view environment(const char* name) {
  const char* value = std::getenv(name);
  return value ? std::string_view(value) : std::string_view();
}

// "de_AT.UTF-8@euro" names the locale "de_AT"; "C" and "POSIX" name none.
std::string identifierFrom(std::string_view posixName) {
  const std::string_view bare = posixName.substr(0, posixName.find_first_of(".@"));
  if (bare.empty() || bare == "C" || bare == "POSIX") return {};
  return std::string(bare);
}

std::string firstIdentifier(std::initializer_list<const char*> variables) {
  for (const char* variable : variables) {
    const std::string_view value = environment(variable);
    // POSIX: the first variable that is set decides, even when it is "C".
    if (!value.empty()) return identifierFrom(value);
  }
  return {};
}

std::string formatIdentifier(const char* category) {
  std::string identifier = firstIdentifier({"LC_ALL", category, "LANG"});
  return identifier.empty() ? std::string(fallbackIdentifier) : identifier;
}

std::string languageTag(std::string identifier) {
  for (char& c : identifier)
    if (c == '_') c = '-';
  return identifier;
}

class EnvironmentLocale final : public UserLocale {
 public:
  std::vector<std::string> languages() const override {
    const std::string messages = firstIdentifier({"LC_ALL", "LC_MESSAGES", "LANG"});
    // GNU gettext: LANGUAGE is a list, and counts only where the locale is not "C".
    if (messages.empty()) return {"en"};
    std::vector<std::string> tags;
    std::string_view list = environment("LANGUAGE");
    while (!list.empty()) {
      const std::size_t end = list.find(':');
      if (std::string tag = languageTag(identifierFrom(list.substr(0, end))); !tag.empty())
        tags.push_back(std::move(tag));
      list = end == std::string_view::npos ? std::string_view() : list.substr(end + 1);
    }
    tags.push_back(languageTag(messages));
    return tags;
  }

  std::string identifier() const override { return formatIdentifier("LC_TIME"); }
  std::string numberIdentifier() const override { return formatIdentifier("LC_NUMERIC"); }
};

}  // namespace

std::unique_ptr<UserLocale> makeUserLocale() {
  return std::make_unique<EnvironmentLocale>();
}

}  // namespace Varnel::Platform::POSIX
