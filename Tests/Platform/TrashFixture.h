// SPDX-License-Identifier: MIT
#pragma once

#include <gtest/gtest.h>

#include <cstdlib>
#include <filesystem>
#include <memory>
#include <string>

#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Platform/Linux/Adapters.h>
#include <Varnel/Platform/POSIX/Adapters.h>
#include <Varnel/Platform/Ports/PrivateFiles.h>
#include <Varnel/Platform/Ports/ReadFile.h>
#include <Varnel/Platform/Ports/Trash.h>
#include <Varnel/Platform/Testing/FakeTimeZones.h>
#include <Varnel/Platform/Testing/SimulatedClock.h>

namespace Varnel::Tests {

using Platform::TrashedFile;
using Platform::TrashError;
using Reason = TrashError::Reason;
using Folders = Platform::Trash::Folders;

/// A home with the desktop's trash, which the file "files/a" may go to.
class TrashFixture : public testing::Test {
 protected:
  TrashFixture() { ::setenv("XDG_DATA_HOME", (home.path() / "data").c_str(), 1); }

  static bool always(const TrashedFile&) { return true; }

  Platform::Result<TrashedFile, TrashError> move(const std::filesystem::path& path,
                                                 const Platform::Trash::Ready& ready = always) {
    const auto state = trash->state(path);
    if (!state) return state.error();
    return trash->move(path, *state, ready);
  }

  /// What is in the trash of the home.
  std::vector<TrashedFile> contents() const { return *trash->contents(folder); }

  static std::string bytes(const std::filesystem::path& path) {
    return Platform::readFile(path).valueOr("nothing");
  }
  static std::string bytes(const TrashedFile& file) {
    return bytes(file.folder + "/files/" + file.name);
  }
  static std::string info(const TrashedFile& file) {
    return bytes(file.folder + "/info/" + file.name + ".trashinfo");
  }

  const TemporaryFolder home = TemporaryFolder::inMemory();
  const std::string folder = home.path() / "data" / "Trash";
  const std::filesystem::path file = home.write("files/a", "bytes");
  Platform::Testing::SimulatedClock clock;
  Platform::Testing::FakeTimeZones zones;
  const std::unique_ptr<Platform::PrivateFiles> files = Platform::POSIX::makePrivateFiles();
  const std::unique_ptr<Platform::Trash> trash = Platform::Linux::makeTrash(*files, clock, zones);
};

}  // namespace Varnel::Tests
