// SPDX-License-Identifier: MIT
#pragma once

#include <gmock/gmock.h>

#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <string>
#include <vector>

#include <Tests/Programs/ScanFolder.h>
#include <Tests/Support/ChildProcess.h>

namespace Orvane::Testing {

struct Outcome {
  int status = -1;  ///< As a shell tells it.
  std::string output;
  std::string errors;
};

/// Runs the program with a home folder and a working folder of its own.
class Orvane : public ::testing::Test {
 protected:
  /// The arguments go to a shell that opens the files and becomes the program.
  Outcome run(const std::vector<std::string>& arguments,
              const std::string& redirection = ">\"$HOME/output\"") {
    std::vector<std::string> words = {"/usr/bin/env", "-i", "HOME=" + home.path()};
    // A sanitizer keeps to the settings of the test in the program too.
    for (const char* name : {"TSAN_OPTIONS", "ASAN_OPTIONS", "LSAN_OPTIONS"})
      if (const char* value = std::getenv(name)) words.push_back(std::string(name) + "=" + value);
    words.insert(words.end(), moreEnvironment.begin(), moreEnvironment.end());
    words.insert(
        words.end(),
        {"/bin/sh", "-c", "exec \"$0\" \"$@\" 2>\"$HOME/errors\" " + redirection, ORVANE_PROGRAM});
    words.insert(words.end(), arguments.begin(), arguments.end());
    const int status = Varnel::Tests::ChildProcess(words).wait();
    return {status, read(home.path("output")), read(home.path("errors"))};
  }

  std::string logText() const {
    std::string text;
    for (const auto& entry : std::filesystem::recursive_directory_iterator(home.path()))
      if (entry.path().extension() == ".log") text += read(entry.path());
    return text;
  }

  void expectFailure(const std::vector<std::string>& arguments, const std::string& complaint) {
    const Outcome outcome = run(arguments);
    EXPECT_EQ(outcome.status, 1);
    EXPECT_EQ(outcome.output, "");
    EXPECT_THAT(outcome.errors, ::testing::HasSubstr(complaint));
  }

  bool hasLog() const { return std::filesystem::exists(home.path("Library")); }

  ScanFolder folder;
  ScanFolder home;
  /// A program that runs another may follow.
  std::vector<std::string> moreEnvironment;

  static std::string read(const std::string& path) {
    std::ostringstream text;
    text << std::ifstream(path, std::ios::binary).rdbuf();
    return text.str();
  }
};

}  // namespace Orvane::Testing
