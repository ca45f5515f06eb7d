// SPDX-License-Identifier: MIT
#pragma once

#include <glib.h>

#include <map>

#include <Varnel/Platform/POSIX/FileDescriptor.h>

namespace Varnel::Platform::Linux {

/// One file descriptor that is readable when a GLib main context has something to dispatch, for
/// hosts that poll by themselves. Made, used and destroyed on the thread that runs the context; the
/// thread owns the context meanwhile; otherwise posts from other threads would not wake it.
class ContextDescriptor final {
 public:
  explicit ContextDescriptor(GMainContext* context);
  ContextDescriptor(const ContextDescriptor&) = delete;
  ContextDescriptor& operator=(const ContextDescriptor&) = delete;
  ~ContextDescriptor();

  /// The descriptor, brought up to date with the sources that the context has now.
  [[nodiscard]] int refreshed();

 private:
  using Events = std::map<int, unsigned>;  // What to wait for, by descriptor.

  [[nodiscard]] Events query(int& timeoutMilliseconds) const;
  void setTimer(int timeoutMilliseconds) const;

  GMainContext* context_;
  POSIX::FileDescriptor all_;
  POSIX::FileDescriptor timer_;
  Events watched_;
};

}  // namespace Varnel::Platform::Linux
