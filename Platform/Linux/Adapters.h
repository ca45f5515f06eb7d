// SPDX-License-Identifier: MIT
#pragma once

#include <chrono>
#include <functional>
#include <memory>
#include <string>

namespace Varnel::Platform {

class ApplicationLauncher;
class ApplicationStorage;
class Clock;
class DelivererConnection;
class DeviceRegistry;
class DiskArbitration;
class ExtendedAttributes;
class HostedApplication;
class MachineIdentity;
class MainQueue;
class NotificationServer;
class PrivateFiles;
class ProcessInfo;
class ProcessLauncher;
class ReadingPriority;
class SoundPlayer;
class StandardOutput;
class SystemLog;
class TimeZones;
class Trash;
class UserLocale;
class UserNotificationCenters;
class VolumeCatalog;
class WallClockTimer;
class Workspace;
struct NotificationSource;

}  // namespace Varnel::Platform

/// Adapters for Linux, beyond those that it shares with the rest of the POSIX family.
namespace Varnel::Platform::Linux {

class MountTable;
class SessionBus;

/// The one view of the mount table that the volume catalogue and disk arbitration share.
[[nodiscard]] std::shared_ptr<MountTable> makeMountTable();

[[nodiscard]] std::unique_ptr<ApplicationStorage> makeApplicationStorage(PrivateFiles& files,
                                                                         SystemLog& systemLog);
/// `folder` is where the kernel lists its block devices.
[[nodiscard]] std::unique_ptr<DeviceRegistry> makeDeviceRegistry(
    const std::string& folder = "/sys/class/block");
[[nodiscard]] std::unique_ptr<DiskArbitration> makeDiskArbitration(
    std::shared_ptr<MountTable> table);
[[nodiscard]] std::unique_ptr<ExtendedAttributes> makeExtendedAttributes();
/// `root` is the folder below which /etc, /proc and /sys lie.
[[nodiscard]] std::unique_ptr<MachineIdentity> makeMachineIdentity(const std::string& root = "/");
/// `root` is the folder below which /proc lies.
[[nodiscard]] std::unique_ptr<ProcessInfo> makeProcessInfo(const std::string& root = "/");
[[nodiscard]] std::unique_ptr<ProcessLauncher> makeProcessLauncher();
[[nodiscard]] std::unique_ptr<ReadingPriority> makeReadingPriority();
/// `root` is the folder below which /etc/localtime lies.
[[nodiscard]] std::unique_ptr<TimeZones> makeTimeZones(const std::string& root = "/");
[[nodiscard]] std::unique_ptr<MainQueue> makeMainQueue();
[[nodiscard]] std::unique_ptr<Trash> makeTrash(PrivateFiles& files, const Clock& clock,
                                               const TimeZones& timeZones);
[[nodiscard]] std::unique_ptr<StandardOutput> makeStandardOutput();
[[nodiscard]] std::unique_ptr<SoundPlayer> makeSoundPlayer(SystemLog& systemLog,
                                                           MainQueue& mainQueue);
/// The desktop shows the banners under the source's name. `patience` is how long a connection to
/// the session bus may take.
[[nodiscard]] std::unique_ptr<NotificationServer> makeNotificationServer(
    SystemLog& systemLog, const NotificationSource& source,
    std::chrono::milliseconds patience = std::chrono::seconds(10));
/// The way to the session's notifier for the product with this base identifier and store, or to the
/// deliverer of this process that `makeDeliverer` makes where there is none.
using MakeDeliverer = std::function<std::unique_ptr<DelivererConnection>()>;
[[nodiscard]] std::shared_ptr<DelivererConnection> makeNotifierConnection(
    std::string baseIdentifier, std::string store, MakeDeliverer makeDeliverer);
/// Starts applications by the desktop entries installed for the user. Part of the notifier alone.
[[nodiscard]] std::unique_ptr<ApplicationLauncher> makeApplicationLauncher(
    std::shared_ptr<SessionBus> bus);
[[nodiscard]] std::unique_ptr<WallClockTimer> makeWallClockTimer(SystemLog& systemLog);

/// What notification centers are made with, beyond a server and a timer each.
struct NotificationPorts {
  Clock& clock;
  UserLocale& userLocale;
  TimeZones& timeZones;
  MainQueue& mainQueue;
  PrivateFiles& privateFiles;
  SystemLog& systemLog;
};
/// The application, which outlives the centers, says whether this process is in front.
[[nodiscard]] std::unique_ptr<UserNotificationCenters> makeUserNotificationCenters(
    const NotificationPorts& ports, HostedApplication& application);

[[nodiscard]] std::unique_ptr<VolumeCatalog> makeVolumeCatalog(std::shared_ptr<MountTable> table);
[[nodiscard]] std::unique_ptr<Workspace> makeWorkspace();

}  // namespace Varnel::Platform::Linux
