// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Ports/UserAccount.h>

#include <pwd.h>
#include <unistd.h>

#include <cstdlib>
#include <optional>
#include <string_view>
#include <vector>

#include <Varnel/Platform/POSIX/Adapters.h>
#include <Varnel/Platform/Values/PathComponents.h>

namespace Varnel::Platform::POSIX {
namespace {

struct Record {
  std::string name;
  std::string homeFolder;
};

std::optional<Record> recordOfUser() {
  std::vector<char> buffer(16384);
  passwd entry{};
  passwd* found = nullptr;
  if (::getpwuid_r(::getuid(), &entry, buffer.data(), buffer.size(), &found) != 0 || !found)
    return std::nullopt;
  return Record{found->pw_name, found->pw_dir};
}

std::optional<std::string> environmentVariable(const char* name) {
  const char* value = std::getenv(name);
  return value && *value ? std::optional<std::string>(value) : std::nullopt;
}

// A relative home would change with the working directory.
std::string homeOr(const std::optional<std::string>& path, std::string_view fallback) {
  return joinPathComponents(pathComponents(path && path->front() == '/' ? *path : fallback));
}

// For a user without a record (in a bare container) the environment serves, and at last the root
// folder.
class PasswdAccount final : public UserAccount {
 public:
  std::string homeFolder() const override {
    const auto home = environmentVariable("HOME");
    // Whoever looks a user up may ask the network.
    return home && home->front() == '/' ? homeOr(home, "/") : realHomeFolder();
  }

  std::string realHomeFolder() const override {
    const auto record = recordOfUser();
    return homeOr(record ? record->homeFolder : environmentVariable("HOME"), "/");
  }

  std::string name() const override {
    if (auto record = recordOfUser()) return record->name;
    return environmentVariable("USER").value_or(std::to_string(::getuid()));
  }
};

}  // namespace

std::unique_ptr<UserAccount> makeUserAccount() {
  return std::make_unique<PasswdAccount>();
}

}  // namespace Varnel::Platform::POSIX
