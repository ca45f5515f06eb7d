// SPDX-License-Identifier: MIT
#pragma once

#include <gmock/gmock.h>

#include <filesystem>
#include <string>
#include <vector>

#include <Scan/DuplicateFinder.h>
#include <Tests/Programs/ScanFakes.h>
#include <Tests/Programs/ScanFolder.h>

namespace Orvane::Testing {

namespace fs = std::filesystem;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::Pair;
using Groups = std::vector<std::vector<std::string>>;

class ScanFixture : public ::testing::Test {
 protected:
  ScanResult scan(const ScanRequest& request) {
    ScanResult result = DuplicateFinder({fileSystem, turns, losses}).find(request, control);
    turns.join();
    return result;
  }
  ScanResult scan(const std::vector<std::string>& folders) {
    return scan(ScanRequest{.folders = folders});
  }
  ScanResult scan() { return scan({folder.path()}); }

  static Groups paths(const ScanResult& result) {
    Groups groups;
    for (const DuplicateGroup& group : result.groups) groups.push_back(result.pathsOf(group));
    return groups;
  }

  void TearDown() override {
    EXPECT_EQ(fileSystem.faults, 0) << "content was read outside a turn";
    EXPECT_EQ(fileSystem.openFolders, 0);
  }

  ScanFolder folder;
  FaultyFileSystem fileSystem;
  FakeTurns turns;
  LossRecorder losses;
  ScanControl control;
};

inline std::string bytes(std::size_t count, char last) {
  std::string text(count, 'x');
  text.back() = last;
  return text;
}

}  // namespace Orvane::Testing
