// SPDX-License-Identifier: MIT
#pragma once

#include <chrono>
#include <functional>
#include <memory>
#include <string>

namespace Varnel::Platform {

class AppendFiles;
class ApplicationStorage;
class Clock;
class CookieStorage;
class HTTPClient;
class PrivateFiles;
class ProcessInfo;
class SecurityScope;
class SessionBoard;
class SystemLog;
class UserAccount;
class UserDefaults;
class UserLocale;

}  // namespace Varnel::Platform

/// Adapters for any system of the POSIX family.
namespace Varnel::Platform::POSIX {

[[nodiscard]] std::unique_ptr<AppendFiles> makeAppendFiles();

/// The settings of an application in the file at `path`, whose name and form the system chooses.
using MakeDefaults = std::function<std::unique_ptr<UserDefaults>(const std::string& path)>;
[[nodiscard]] std::unique_ptr<ApplicationStorage> makeApplicationStorage(std::string settingsName,
                                                                         MakeDefaults makeDefaults);

[[nodiscard]] std::unique_ptr<Clock> makeClock();
[[nodiscard]] std::unique_ptr<CookieStorage> makeCookieStorage(const ProcessInfo& process,
                                                               const Clock& clock);
/// Every post fails when the module of libcurl is missing.
[[nodiscard]] std::unique_ptr<HTTPClient> makeHTTPClient();
[[nodiscard]] std::unique_ptr<PrivateFiles> makePrivateFiles();
/// `executable` is the absolute path of the running program, which an update may rename meanwhile.
[[nodiscard]] std::unique_ptr<ProcessInfo> makeProcessInfo(const std::string& executable);
[[nodiscard]] std::unique_ptr<SecurityScope> makeSecurityScope();
/// In $XDG_RUNTIME_DIR. The files outlive it. Nobody waits longer than `patience` for a place.
[[nodiscard]] std::unique_ptr<SessionBoard> makeSessionBoard(
    PrivateFiles& files, std::chrono::milliseconds patience = std::chrono::seconds(10));
[[nodiscard]] std::unique_ptr<SystemLog> makeSystemLog();
[[nodiscard]] std::unique_ptr<UserAccount> makeUserAccount();
[[nodiscard]] std::unique_ptr<UserLocale> makeUserLocale();

}  // namespace Varnel::Platform::POSIX
