// SPDX-License-Identifier: MIT
#pragma once

#include <string>
#include <vector>

#include <Scan/ScanResult.h>

namespace Orvane {

class ContentAccess;
class FileSystem;
class ScanObserver;
struct ScanControl;

/// Finds the files of equal content in some folders. Files are told apart by their size, then by a
/// digest of their beginning, then by a digest of everything. Files that still agree are compared
/// byte by byte, so the result holds true duplicates only.
///
///     DuplicateFinder finder({systemFileSystem(), access, observer}, 4);
///     ScanResult result = finder.find({"/home/u/Pictures"}, control);
///
/// All hard links of a file count as one file, known by the first of its paths; symbolic links and
/// empty files have no part. A file that cannot be read, is gone or changes meanwhile is left out,
/// counted and reported to the observer. The same files give the same result in the same order,
/// however many threads read them. One call at a time; the finder keeps nothing from one to the
/// next.
class DuplicateFinder final {
 public:
  struct Ports {
    FileSystem& fileSystem;
    ContentAccess& access;
    ScanObserver& observer;
  };

  /// `threads`: how many read at once, at least 1.
  DuplicateFinder(Ports ports, unsigned threads);

  /// Scans folders given by absolute paths without symbolic links. Once `control` asks to stop it
  /// returns soon, with a result that is of no use.
  [[nodiscard]] ScanResult find(const std::vector<std::string>& folders, ScanControl& control);

 private:
  Ports ports_;
  unsigned threads_;
};

}  // namespace Orvane
