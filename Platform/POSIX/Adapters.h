// SPDX-License-Identifier: MIT
#pragma once

#include <memory>

namespace Varnel::Platform {

class AppendFiles;
class Clock;
class HTTPClient;
class PrivateFiles;
class SecurityScope;
class SystemLog;
class UserAccount;
class UserLocale;

}  // namespace Varnel::Platform

/// Adapters for any system of the POSIX family.
namespace Varnel::Platform::POSIX {

[[nodiscard]] std::unique_ptr<AppendFiles> makeAppendFiles();
[[nodiscard]] std::unique_ptr<Clock> makeClock();
/// Every post fails when the module of libcurl is missing.
[[nodiscard]] std::unique_ptr<HTTPClient> makeHTTPClient();
[[nodiscard]] std::unique_ptr<PrivateFiles> makePrivateFiles();
[[nodiscard]] std::unique_ptr<SecurityScope> makeSecurityScope();
[[nodiscard]] std::unique_ptr<SystemLog> makeSystemLog();
[[nodiscard]] std::unique_ptr<UserAccount> makeUserAccount();
[[nodiscard]] std::unique_ptr<UserLocale> makeUserLocale();

}  // namespace Varnel::Platform::POSIX
