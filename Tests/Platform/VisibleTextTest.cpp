// SPDX-License-Identifier: MIT
#include <Varnel/Platform/Text/VisibleText.h>

#include <string_view>

#include <gtest/gtest.h>

namespace Varnel::Platform {
namespace {

TEST(VisibleText, LeavesTextAloneAndShowsTheRest) {
  const struct {
    std::string_view bytes, shown;
  } cases[] = {
      {"", ""},
      {"plain — ünïcödé 漢字 😀", "plain — ünïcödé 漢字 😀"},
      {"a\nb\tc\r\a\x06\x0e\x1b\x7f", "a\\nb\\tc\\r\\a\\x06\\x0E\\x1B\\x7F"},
      {"back\\slash", "back\\\\slash"},
      {"\xc2\x9bM", "\\xC2\\x9BM"},                       // a control in two bytes
      {"evil\xe2\x80\xaegpj", "evil\\xE2\\x80\\xAEgpj"},  // turns the writing around
      {"line\xe2\x80\xa8", "line\\xE2\\x80\\xA8"},        // a line separator
      {"par\xe2\x80\xa9", "par\\xE2\\x80\\xA9"},          // one of paragraphs
      {"\xff\xfe", "\\xFF\\xFE"},
      {"cut \xe6\xbc", "cut \\xE6\\xBC"},
      {"\xc0\xaf", "\\xC0\\xAF"},  // "/" written too long
      {"\xe0\x80\x80", "\\xE0\\x80\\x80"},
      {"\xed\xa0\x80", "\\xED\\xA0\\x80"},           // half a surrogate pair
      {"\xf4\x90\x80\x80", "\\xF4\\x90\\x80\\x80"},  // beyond the last character
      {"\xc3\xa4\x80", "ä\\x80"},
      {"\xc2\x85\xe2\x81\xa6\xd8\x9c\xef\xbb\xbf",
       "\\xC2\\x85\\xE2\\x81\\xA6\\xD8\\x9C\\xEF\\xBB\\xBF"},
  };
  for (const auto& [bytes, shown] : cases) EXPECT_EQ(visibleText(std::string(bytes)), shown);
  EXPECT_EQ(visibleText(std::string(1, '\0')), "\\x00");
  EXPECT_EQ(visibleText("back\\slash\n", Backslashes::kept), "back\\slash\\n");
}

}  // namespace
}  // namespace Varnel::Platform
