// SPDX-License-Identifier: MIT
#pragma once

#include <Scan/ScanRequest.h>
#include <Scan/ScanResult.h>

namespace Orvane {

class DiskTurns;
class FileSystem;
class ScanObserver;
struct ScanControl;

/// Finds the files of equal content in some folders. Files are told apart by their size, then by
/// their beginning, large ones by something of their middle and end, and then by the rest. What
/// was read is compared by digests of 128 bits that depend on a secret of each scan, so that equal
/// digests mean equal contents for all a list of duplicates is good for. Who *removes* a file must
/// compare its bytes with those of the one that stays.
///
///     DuplicateFinder finder({systemFileSystem(), turns, observer});
///     ScanResult result = finder.find({.folders = {"/home/u/Pictures"}}, control);
///
/// All hard links of a file count as one file, known by the first of its paths, those in reference
/// folders before others; symbolic links and empty files have no part. Where all files of a group
/// are to stay, it is none. A file that cannot be read, is gone or changes meanwhile is left out,
/// counted and reported to the observer. The same files give the same result in the same order,
/// however many threads read them. One call at a time; the finder keeps nothing from one to the
/// next.
class DuplicateFinder final {
 public:
  struct Ports {
    FileSystem& fileSystem;
    DiskTurns& turns;
    ScanObserver& observer;
  };

  explicit DuplicateFinder(Ports ports) : ports_(ports) {}

  /// Once `control` asks to stop it returns soon, with a partial result: the files that were
  /// compared by then.
  [[nodiscard]] ScanResult find(const ScanRequest& request, ScanControl& control);

 private:
  Ports ports_;
};

}  // namespace Orvane
