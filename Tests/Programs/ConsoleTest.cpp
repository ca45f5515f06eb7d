// SPDX-License-Identifier: MIT
#include <gmock/gmock.h>

#include <csignal>

#include <orvane/Interruption.h>
#include <orvane/VisibleText.h>

namespace Orvane::Testing {
namespace {

TEST(VisibleText, LeavesTextAloneAndShowsTheRest) {
  const struct {
    std::string_view bytes, shown;
  } cases[] = {
      {"", ""},
      {"plain — ünïcödé 漢字 😀", "plain — ünïcödé 漢字 😀"},
      {"a\nb\tc\r\a\x1b\x7f", "a\\nb\\tc\\r\\a\\x1B\\x7F"},
      {"back\\slash", "back\\\\slash"},
      {"\xc2\x9b"
       "2J",
       "\\xC2\\x9B2J"},  // a control in two bytes
      {"evil\xe2\x80\xae"
       "gpj",
       "evil\\xE2\\x80\\xAEgpj"},                   // turns the writing around
      {"line\xe2\x80\xa8", "line\\xE2\\x80\\xA8"},  // a line separator
      {"\xff\xfe", "\\xFF\\xFE"},
      {"cut \xe6\xbc", "cut \\xE6\\xBC"},
      {"\xc0\xaf", "\\xC0\\xAF"},  // "/" written too long
      {"\xe0\x80\x80", "\\xE0\\x80\\x80"},
      {"\xed\xa0\x80", "\\xED\\xA0\\x80"},           // half a surrogate pair
      {"\xf4\x90\x80\x80", "\\xF4\\x90\\x80\\x80"},  // beyond the last character
      {"\xc3\xa4\x80", "ä\\x80"},
  };
  for (const auto& [bytes, shown] : cases) EXPECT_EQ(visibleText(bytes), shown);
  EXPECT_EQ(visibleText(std::string_view("\0", 1)), "\\x00");
}

TEST(Interruption, TheFirstSignalAsksAndTheSecondEnds) {
  std::atomic<bool> flag{false};
  {
    const Interruption interruption(flag);
    EXPECT_EQ(interruption.signal(), 0);
    std::raise(SIGINT);
    EXPECT_TRUE(flag);
    EXPECT_EQ(interruption.signal(), SIGINT);
    EXPECT_EXIT(std::raise(SIGINT), ::testing::KilledBySignal(SIGINT), "");
  }
  EXPECT_EXIT(std::raise(SIGTERM), ::testing::KilledBySignal(SIGTERM), "");
}

TEST(Interruption, WhatWasIgnoredStaysIgnored) {
  (void)std::signal(SIGINT, SIG_IGN);
  std::atomic<bool> flag{false};
  {
    const Interruption interruption(flag);
    std::raise(SIGINT);
  }
  std::raise(SIGINT);
  EXPECT_FALSE(flag);
  (void)std::signal(SIGINT, SIG_DFL);
}

}  // namespace
}  // namespace Orvane::Testing
