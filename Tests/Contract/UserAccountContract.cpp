// SPDX-License-Identifier: MIT
#include <Tests/Contract/UserWorlds.h>

#include <utility>

#include <Varnel/Platform/Testing/FakeUser.h>

namespace Varnel::Platform::Contract {
namespace {

TEST_P(UserAccountContract, AHomeIsAnAbsolutePathAndTheOneOnRecordStays) {
  const UserAccount& account = world->account();
  const std::string real = account.realHomeFolder();
  EXPECT_TRUE(real.starts_with('/') && (real == "/" || !real.ends_with('/'))) << real;
  EXPECT_FALSE(account.name().empty());
  const std::pair<const char*, std::string> cases[] = {
      {"/moved//", "/moved"}, {"//", "/"},      {"/", "/"}, {"", real},
      {"relative", real},     {"./home", real}, {"~", real}};
  for (const auto& [home, folder] : cases) {
    world->moveHome(home);
    EXPECT_EQ(account.homeFolder(), folder) << home;
    EXPECT_EQ(account.realHomeFolder(), real) << home;
  }
}

class FakeWorld final : public UserAccountWorld {
 public:
  UserAccount& account() override { return account_; }
  void moveHome(const std::string& path) override { account_.home = path; }

 private:
  Testing::FakeUserAccount account_;
};

INSTANTIATE_TEST_SUITE_P(Fake, UserAccountContract, UserAccountContract::on<FakeWorld>());

}  // namespace
}  // namespace Varnel::Platform::Contract
