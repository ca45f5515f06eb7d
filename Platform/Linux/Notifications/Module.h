// SPDX-License-Identifier: MIT
#pragma once

#include <chrono>
#include <string>

#include <Varnel/Platform/Linux/Adapters.h>

namespace Varnel::Platform {
class DelivererConnection;
class NotificationServer;
class SystemLog;
struct NotificationSource;
}  // namespace Varnel::Platform

/// The entries of the module that speaks to the session bus through GIO. The caller owns what they
/// make.
extern "C" __attribute__((visibility("default"))) Varnel::Platform::NotificationServer*
varnelMakeNotificationServer(Varnel::Platform::SystemLog& systemLog,
                             const Varnel::Platform::NotificationSource& source,
                             std::chrono::milliseconds patience);

extern "C" __attribute__((visibility("default"))) Varnel::Platform::DelivererConnection*
varnelMakeNotifierConnection(const std::string& baseIdentifier, const std::string& store,
                             const Varnel::Platform::Linux::MakeDeliverer& makeDeliverer);
