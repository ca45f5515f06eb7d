// SPDX-License-Identifier: MIT
#pragma once

#include <filesystem>
#include <string>
#include <vector>

#include <Varnel/Platform/Ports/CookieStorage.h>

namespace Varnel::Platform {

class Clock;

/// Cookie stores in the layout of browsers and desktop libraries: the table `moz_cookies` of an
/// SQLite file, expiry in seconds since 1970. An application's own is `APPLICATION/cookies.sqlite`
/// below the data folder, a group's `group-containers/GROUP/cookies.sqlite`.
///
/// Files are opened for each call and only read. While another process writes, the call waits
/// briefly.
class SQLiteCookieStorage final : public CookieStorage {
 public:
  SQLiteCookieStorage(std::filesystem::path dataFolder, std::string application,
                      const Clock& clock);

  [[nodiscard]] bool hasGroupContainers() const override { return true; }
  [[nodiscard]] std::vector<Cookie> cookies() override;
  [[nodiscard]] std::vector<Cookie> cookiesOfGroupContainer(const std::string& identifier) override;

 private:
  [[nodiscard]] std::vector<Cookie> cookiesIn(const std::filesystem::path& folder) const;

  const std::filesystem::path dataFolder_;
  const std::string application_;
  const Clock& clock_;
};

}  // namespace Varnel::Platform
