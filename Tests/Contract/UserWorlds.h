// SPDX-License-Identifier: MIT
#pragma once

#include <vector>

#include <Tests/Contract/Contract.h>
#include <Varnel/Platform/Ports/ApplicationLauncher.h>
#include <Varnel/Platform/Ports/ApplicationStorage.h>
#include <Varnel/Platform/Ports/CookieStorage.h>
#include <Varnel/Platform/Ports/MachineIdentity.h>
#include <Varnel/Platform/Ports/TimeZones.h>
#include <Varnel/Platform/Ports/UserAccount.h>
#include <Varnel/Platform/Ports/UserDefaults.h>
#include <Varnel/Platform/Ports/UserLocale.h>
#include <Varnel/Platform/Ports/Workspace.h>

namespace Varnel::Platform::Contract {

/// A desktop on which nothing is installed.
class ApplicationLauncherWorld : public WorldOf<ApplicationLauncher> {
 public:
  /// An application with one action.
  virtual void install(const std::string& desktopEntry, const std::string& action) = 0;
  /// What the last launch has started; waited for.
  virtual ApplicationLaunch started() = 0;
};
using ApplicationLauncherContract = Suite<ApplicationLauncherWorld>;

/// A machine that hides who it is.
class MachineIdentityWorld : public WorldOf<MachineIdentity> {
 public:
  /// 32 hexadecimal digits, and a text; an empty one stands in the place of an identity.
  virtual void identify(const std::string& uuid, const std::string& serial) = 0;
  /// Gives the primary interface this hardware address; empty for none.
  virtual void connect(const PropertyData& address) = 0;
};
using MachineIdentityContract = Suite<MachineIdentityWorld>;

/// A system that knows the zones of `zonesOf2026`.
class TimeZonesWorld : public WorldOf<TimeZones> {
 public:
  virtual void moveUser(const std::string& zone) = 0;
};
using TimeZonesContract = Suite<TimeZonesWorld>;

class UserAccountWorld : public WorldOf<UserAccount> {
 public:
  /// Moves the home away from the one on record, as an environment or a sandbox does.
  virtual void moveHome(const std::string& path) = 0;
};
using UserAccountContract = Suite<UserAccountWorld>;

/// A user who has chosen nothing yet.
class UserLocaleWorld : public WorldOf<UserLocale> {
 public:
  /// Languages as in "de_AT", best first, and the locales of dates and numbers.
  virtual void choose(const std::vector<std::string>& languages, const std::string& dates,
                      const std::string& numbers) = 0;
};
using UserLocaleContract = Suite<UserLocaleWorld>;

/// A user without any application.
class WorkspaceWorld : public WorldOf<Workspace> {
 public:
  /// Installs a program under this identifier and returns its file; with a bundle, the folder.
  virtual URL install(const std::string& identifier, bool hasBundle) = 0;
  virtual void remove(const std::string& identifier) = 0;
};
using WorkspaceContract = Suite<WorkspaceWorld>;

/// A user of whom nobody has kept a cookie yet.
class CookieStorageWorld : public WorldOf<CookieStorage> {
 public:
  /// Fills this application's own store, or that of a group.
  virtual void fillOwn(const std::vector<Cookie>& cookies) = 0;
  virtual void fillGroup(const std::string& identifier, const std::vector<Cookie>& cookies) = 0;
};
using CookieStorageContract = Suite<CookieStorageWorld>;

/// A user whose folders are empty.
class UserDefaultsWorld : public WorldOf<ApplicationStorage> {
 public:
  /// That of another process of the same user.
  virtual ApplicationStorage& storageOfAnother() = 0;
};
using UserDefaultsContract = Suite<UserDefaultsWorld>;

}  // namespace Varnel::Platform::Contract
