// SPDX-License-Identifier: MIT
#pragma once

#include <memory>
#include <thread>
#include <vector>

#include <Varnel/Platform/Linux/Disks/MountTable.h>
#include <Varnel/Platform/POSIX/FileDescriptor.h>
#include <Varnel/Platform/Ports/VolumeCatalog.h>

namespace Varnel::Platform::Linux {

/// A subscription to the changes of the mount table: a thread that waits for them in the kernel and
/// ends with this object. The table shows a change before the handler hears of it. A volume that
/// went and came back before the thread could look may go unreported.
class VolumeWatch final : public VolumeCatalog::Subscription {
 public:
  /// Changes after the return are reported. Null when the table cannot be watched.
  [[nodiscard]] static std::unique_ptr<VolumeWatch> start(std::shared_ptr<MountTable> table,
                                                          VolumeCatalog::ChangeHandler handler);
  ~VolumeWatch() override;
  VolumeWatch(const VolumeWatch&) = delete;
  VolumeWatch& operator=(const VolumeWatch&) = delete;

 private:
  VolumeWatch(std::shared_ptr<MountTable> table, VolumeCatalog::ChangeHandler handler);
  [[nodiscard]] bool begin();
  void run();

  const std::shared_ptr<MountTable> table_;
  const VolumeCatalog::ChangeHandler handler_;
  POSIX::FileDescriptor mountInfo_;
  POSIX::FileDescriptor stop_;  ///< An event that becomes readable when the thread is to end.
  std::shared_ptr<const VolumeTable> told_;  ///< What the handler knows. Belongs to the thread.
  std::thread thread_;
};

/// The changes from one view to the other: first the volumes that went, then those that came.
[[nodiscard]] std::vector<VolumeChange> changesBetween(const VolumeTable& before,
                                                       const VolumeTable& after);

}  // namespace Varnel::Platform::Linux
