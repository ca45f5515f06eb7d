// SPDX-License-Identifier: MIT
#include <gtest/gtest.h>

#include <cstring>

#include <Tests/Logging/LoggerFixture.h>
#include <Varnel/DiskAccess/DiskAccessManager.h>
#include <Varnel/DiskWatch/DiskAccessNote.h>
#include <Varnel/DiskWatch/DiskAccessWatch.h>

namespace Varnel {
namespace {

using namespace std::chrono_literals;
using Platform::URL;

class DiskAccessWatchTest : public Tests::LoggerFixture {
 protected:
  std::size_t warnings() const {
    std::size_t count = 0;
    const std::string text = printed();
    for (std::size_t at = 0; (at = text.find("Warning: ", at)) != text.npos; ++at) ++count;
    return count;
  }
};

TEST_F(DiskAccessWatchTest, NamesOnceEachPlaceThatIsHeldForLongAndTellsTheOthers) {
  const URL volume = URL::fileURLWithPath("/stick/");
  DiskAccessManager manager(fakes.ports());
  const auto begin = [&] {
    return manager.beginAccessingURL(volume, "copy\n", Platform::QualityOfService::utility, false,
                                     {}, volume);
  };
  std::optional<DiskAccessWatch> watch;
  watch.emplace(DiskAccessWatch::Ports{manager, fakes.sessionBoard, logger()}, "host");
  const auto session = begin();
  const auto now = std::chrono::steady_clock::now();
  watch->look(now + 59s);
  EXPECT_EQ(warnings(), 0u);
  for (const auto time : {61s, 62s}) watch->look(now + time);
  EXPECT_EQ(warnings(), 1u);
  EXPECT_NE(printed().find("\"unknown\" has been held for longer than a minute, for \"copy\\n\""),
            std::string::npos)
      << printed();
  const auto later = begin();
  watch->look(std::chrono::steady_clock::now() + 70s);
  EXPECT_EQ(warnings(), 2u);

  const auto note = DiskAccessNote::fromText(fakes.sessionBoard.notes().at(0).text);
  ASSERT_TRUE(note && note->disks.size() == 1 && note->disks[0].places.size() == 2);
  EXPECT_EQ(note->program, "host");
  EXPECT_EQ(note->disks[0].places[0].propose, "copy\n");
  EXPECT_NEAR(note->disks[0].places[0].seconds, 70, 10);
  watch.reset();
  EXPECT_TRUE(fakes.sessionBoard.notes().empty());
  session->endAccessing();
  later->endAccessing();
}

TEST(DiskAccessNote, ComesBackFromItsTextAndFromNothingElse) {
  DiskAccessNote note;
  note.program = "\xff";
  note.disks.push_back({.uniqueID = "", .volume = "/", .maxReaders = 4, .waiters = {1, 0, 0, 2}});
  note.disks[0].places = {{"\"\n", 0.25}, {"", 3}};
  const std::string text = note.text();
  note.program = "\xef\xbf\xbd";
  EXPECT_EQ(DiskAccessNote::fromText(text), note);

  const auto changed = [&](const char* from, const char* to) {
    std::string other = text;
    return other.replace(other.find(from), std::strlen(from), to);
  };
  const std::string others[] = {"",
                                "{}",
                                "[]",
                                text.substr(1),
                                changed("[1,0,0,2]", "[1,0,0]"),
                                changed("[1,0,0,2]", "[1,0,0,-2]"),
                                changed("[1,0,0,2]", "[1,0,0,1e99]"),
                                changed("0.25", "-0.25"),
                                changed("0.25", "null"),
                                changed("\"/\"", "7"),
                                changed("4", "\"4\""),
                                changed("4", "-4")};
  for (const std::string& other : others) EXPECT_FALSE(DiskAccessNote::fromText(other)) << other;
}

// A hostile host, or a busy one, must not keep its note off the board.
TEST(DiskAccessNote, FitsOnTheBoard) {
  std::vector<DiskAccessSnapshot> disks;
  for (int i = 0; i < 1000; ++i)
    disks.push_back({.disk = std::make_shared<OVDiskInfo>(
                         std::string(500, '\x01'), OVDiskInfo::VolumeURLs(), OVDiskKindUnknown),
                     .places = {{Basalt::currentThreadID(), std::string(500, '\x01'), {}}}});
  const DiskAccessNote note("host", disks, {});
  EXPECT_LT(note.text().size(), Platform::SessionBoard::maxNoteSize);
  EXPECT_GE(note.disks.size(), 24u);
}

}  // namespace
}  // namespace Varnel
