// SPDX-License-Identifier: MIT
#pragma once

namespace Varnel::Platform {

class Clock;
class MainQueue;
class NotificationServer;
class PrivateFiles;
class SystemLog;
class TimeZones;
class UserLocale;
class WallClockTimer;

/// What a deliverer of notifications is made with. All outlive it; no one else uses the server and
/// the timer.
struct DelivererPorts final {
  Clock& clock;
  UserLocale& userLocale;
  TimeZones& timeZones;
  MainQueue& mainQueue;
  PrivateFiles& privateFiles;
  SystemLog& systemLog;
  NotificationServer& notificationServer;
  WallClockTimer& timer;
};

}  // namespace Varnel::Platform
