// SPDX-License-Identifier: MIT

// Mount table, inventory and the volume of a path, against the libraries that a program would
// otherwise ask. Both sides take turns; only the ratios of one run mean anything.

#include <libmount.h>
#include <libudev.h>

#include <cstdlib>
#include <string>

#include <Benchmarks/Measurements.h>
#include <Varnel/DiskAccess/OVDiskInfo.h>
#include <Varnel/Platform/Linux/Adapters.h>
#include <Varnel/Platform/Linux/Disks/MountInfo.h>
#include <Varnel/Platform/Linux/Disks/MountTable.h>
#include <Varnel/Platform/Ports/DeviceRegistry.h>
#include <Varnel/Platform/Ports/DiskArbitration.h>
#include <Varnel/Platform/Ports/VolumeCatalog.h>
#include <Varnel/Platform/Values/UniqueHandle.h>

namespace Varnel::Benchmarks {
namespace {

using Platform::UniqueHandle;
using Udev = UniqueHandle<udev*, udev_unref>;
using Enumeration = UniqueHandle<udev_enumerate*, udev_enumerate_unref>;
using UdevDevice = UniqueHandle<udev_device*, udev_device_unref>;

constexpr std::size_t rounds = 2000;
constexpr double atMedian = 0.5;

void libmountParse() {
  libmnt_table* table = mnt_new_table_from_file("/proc/self/mountinfo");
  if (!table) std::abort();
  mnt_unref_table(table);
}

void udevEnumeration() {
  const Udev context(udev_new());
  const Enumeration enumeration(udev_enumerate_new(context.get()));
  udev_enumerate_add_match_subsystem(enumeration.get(), "block");
  udev_enumerate_scan_devices(enumeration.get());
  udev_list_entry* entry = nullptr;
  udev_list_entry_foreach(entry, udev_enumerate_get_list_entry(enumeration.get())) {
    const UdevDevice device(
        udev_device_new_from_syspath(context.get(), udev_list_entry_get_name(entry)));
    for (const char* attribute : {"removable", "queue/rotational", "device/serial", "size", "ro"})
      (void)udev_device_get_sysattr_value(device.get(), attribute);
  }
}

void compareMountTable() {
  Comparison parse;
  Comparison cached;
  const auto table = Platform::Linux::makeMountTable();
  const auto libmount = [] { return timeOf(libmountParse); };
  parse.measure(
      rounds,
      [] {
        return timeOf([] {
          std::string bytes;
          const auto file = Platform::Linux::openMountInfo();
          if (!Platform::Linux::readWhole(file, bytes)) std::abort();
          (void)Platform::Linux::parseMountInfo(bytes);
        });
      },
      libmount);
  cached.measure(
      rounds, [&] { return timeOf([&] { (void)table->current(); }); }, libmount);
  parse.report("mount table, read and parsed / libmount", atMedian, 0.7);
  cached.report("mount table, unchanged / libmount", atMedian, 0.7);
}

void compareInventory() {
  const auto table = Platform::Linux::makeMountTable();
  const auto devices = Platform::Linux::makeDeviceRegistry();
  const auto disks = Platform::Linux::makeDiskArbitration(table);
  const auto volumes = Platform::Linux::makeVolumeCatalog(table);
  Comparison inventory;
  inventory.measure(
      rounds,
      [&] {
        return timeOf([&] {
          (void)OVDiskInfo::allDiskInfos(
              {.devices = *devices, .disks = *disks, .volumes = *volumes});
        });
      },
      [] { return timeOf(udevEnumeration); });
  inventory.report("inventory / udev enumeration with 5 attributes each", atMedian, 0.3);

  const auto url = Platform::URL::fileURLWithPath("/usr/share/doc");
  Comparison lookup;
  lookup.measure(
      rounds, [&] { return timeOf([&] { (void)volumes->volumeURL(url); }); },
      [] { return 2000.0; });
  lookup.report("volume of a path / two microseconds", atMedian, 1.0);
}

}  // namespace
}  // namespace Varnel::Benchmarks

int main() {
  Varnel::Benchmarks::compareMountTable();
  Varnel::Benchmarks::compareInventory();
}
