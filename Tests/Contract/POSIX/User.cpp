// SPDX-License-Identifier: MIT
#include <Tests/Contract/UserWorlds.h>

#include <stdlib.h>

#include <Varnel/Platform/POSIX/Adapters.h>

namespace Varnel::Platform::Contract {
namespace {

class PasswdAccount final : public AdapterColumn<UserAccountWorld, POSIX::makeUserAccount> {
 public:
  void moveHome(const std::string& path) override { ::setenv("HOME", path.c_str(), 1); }
};
INSTANTIATE_TEST_SUITE_P(POSIX, UserAccountContract, on<PasswdAccount>());

class EnvironmentLocale final : public AdapterColumn<UserLocaleWorld, POSIX::makeUserLocale> {
 public:
  EnvironmentLocale() {
    for (const char* name : {"LANG", "LANGUAGE", "LC_ALL", "LC_MESSAGES", "LC_NUMERIC", "LC_TIME"})
      ::unsetenv(name);
  }
  void choose(const std::vector<std::string>& languages, const std::string& dates,
              const std::string& numbers) override {
    std::string list;
    for (const std::string& language : languages)
      if (&language != &languages.back()) list += language + ":";
    ::setenv("LANGUAGE", list.c_str(), 1);
    ::setenv("LC_MESSAGES", (languages.back() + ".UTF-8").c_str(), 1);
    ::setenv("LC_TIME", dates.c_str(), 1);
    ::setenv("LC_NUMERIC", numbers.c_str(), 1);
  }
};
INSTANTIATE_TEST_SUITE_P(POSIX, UserLocaleContract, on<EnvironmentLocale>());

}  // namespace
}  // namespace Varnel::Platform::Contract
