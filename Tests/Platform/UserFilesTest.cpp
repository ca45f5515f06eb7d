// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>
#include <sys/stat.h>

#include <cstdlib>
#include <filesystem>

#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Platform/POSIX/Adapters.h>
#include <Varnel/Platform/Ports/ReadFile.h>
#include <Varnel/Platform/Ports/UserLocale.h>
#include <Varnel/Platform/Values/UTF8.h>

namespace Varnel::Platform {
namespace {

namespace fs = std::filesystem;

TEST(ReadFile, GivesAllBytesOrTheReason) {
  const Tests::TemporaryFolder folder;
  const std::string bytes = std::string(200'000, 'a') + std::string("\0\xFF\n", 3);
  const std::string file = folder.write("file", bytes);
  EXPECT_EQ(*readFile(file), bytes);
  EXPECT_EQ(*readFile(file, bytes.size()), bytes);
  EXPECT_EQ(readFile(file, bytes.size() - 1).error(), std::errc::file_too_large);
  EXPECT_EQ(*readFile(folder.write("empty", ""), 0), "");
  EXPECT_FALSE(readFile("/proc/self/stat")->empty());

  EXPECT_EQ(readFile(folder.path() / "missing").error(), std::errc::no_such_file_or_directory);
  EXPECT_EQ(readFile(file + "/in a file").error(), std::errc::not_a_directory);
  const std::string pipe = folder.path() / "pipe";
  ASSERT_EQ(::mkfifo(pipe.c_str(), 0600), 0);
  for (const std::string& path :
       {pipe, folder.path().string(), std::string("/dev/zero"), file + '\0'})
    EXPECT_EQ(readFile(path).error(), std::errc::invalid_argument) << path;
}

TEST(UTF8, IsRefusedWhereItIsMalformed) {
  for (const char* text : {"", "plain", "12345678", "12345678ü", "1234567ü", "\U0010FFFF", "é€😀"})
    EXPECT_TRUE(isValidUTF8(text)) << text;
  EXPECT_TRUE(isValidUTF8(std::string_view("a\0ü", 4)));
  for (const char* text : {"\x80", "12345678\xFF", "1234567\xC3", "\xC0\xAF", "\xED\xA0\x80",
                           "\xF4\x90\x80\x80", "\xE2\x82", "ü\xFE"})
    EXPECT_FALSE(isValidUTF8(text)) << text;
}

TEST(UserLocale, TakesDatesAndNumbersEachFromTheirCategory) {
  const struct {
    const char* all;
    const char* time;
    const char* numeric;
    const char* language;
    const char* dates;
    const char* numbers;
  } rows[] = {
      {"", "en_GB.UTF-8", "de_AT.UTF-8@euro", "fr_FR", "en_GB", "de_AT"},
      {"", "en_GB.UTF-8", "", "fr_FR", "en_GB", "fr_FR"},
      {"", "", "de_AT", "fr_FR", "fr_FR", "de_AT"},
      {"ja_JP", "en_GB", "de_AT", "fr_FR", "ja_JP", "ja_JP"},
      {"", "en_GB", "C", "fr_FR", "en_GB", "en_US"},
      {"", "", "", "", "en_US", "en_US"},
  };
  for (const auto& row : rows) {
    ::setenv("LC_ALL", row.all, 1);
    ::setenv("LC_TIME", row.time, 1);
    ::setenv("LC_NUMERIC", row.numeric, 1);
    ::setenv("LANG", row.language, 1);
    const auto locale = POSIX::makeUserLocale();
    EXPECT_EQ(locale->identifier(), row.dates) << &row - rows;
    EXPECT_EQ(locale->numberIdentifier(), row.numbers) << &row - rows;
  }
}

}  // namespace
}  // namespace Varnel::Platform
