// SPDX-License-Identifier: MIT
#include <Tests/Contract/ProcessWorlds.h>

#include <Varnel/Platform/Testing/CapturedOutput.h>

namespace Varnel::Platform::Contract {
namespace {

using namespace std::string_literals;

TEST_P(SystemLogContract, WritesOneVisibleLineForEachText) {
  for (const std::string& text :
       {"100 %s ünïcode \\"s, ""s, "two\nlines\r"s, "a\0b"s, "\xFF"s, std::string(2000, 'x')})
    world->log().write(text);
  EXPECT_EQ(world->text(), "100 %s ünïcode \\\n\ntwo\\nlines\\r\na\\x00b\n\\xFF\n" +
                               std::string(2000, 'x') + "\n");
}

class FakeWorld final : public SystemLogWorld {
 public:
  SystemLog& log() override { return log_; }
  std::string text() override { return log_.text(); }

 private:
  Testing::CapturedSystemLog log_;
};
INSTANTIATE_TEST_SUITE_P(Fake, SystemLogContract, SystemLogContract::on<FakeWorld>());

}  // namespace
}  // namespace Varnel::Platform::Contract
