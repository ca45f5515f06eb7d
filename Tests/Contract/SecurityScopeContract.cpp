// SPDX-License-Identifier: MIT
#include <Tests/Contract/FilesWorlds.h>

#include <Varnel/Platform/Testing/FakeSecurityScope.h>

namespace Varnel::Platform::Contract {
namespace {

TEST_P(SecurityScopeContract, OpensForFilesThatTheProcessMayRead) {
  SecurityScope& scope = world->scope();
  for (const URL& url : {world->readable(false), world->readable(true)}) {
    for (int i = 0; i < 2; ++i) EXPECT_TRUE(scope.startAccessing(url));
    for (int i = 0; i < 2; ++i) scope.stopAccessing(url);
    EXPECT_TRUE(scope.startAccessing(url));
    scope.stopAccessing(url);
    const std::string path = url.path();
    EXPECT_FALSE(scope.startAccessing(*URL::parse("https://h.example" + path))) << path;
    EXPECT_FALSE(scope.startAccessing(*URL::parse("file://" + path + "%00"))) << path;
  }
  EXPECT_FALSE(scope.startAccessing(world->forbidden()));
}

class FakeWorld final : public SecurityScopeWorld {
 public:
  FakeWorld() { scope_.forbid(forbidden()); }
  SecurityScope& scope() override { return scope_; }
  URL readable(bool isFolder) override {
    return *URL::parse(isFolder ? "file:///f/" : "file:///f");
  }
  URL forbidden() override { return *URL::parse("file:///forbidden"); }

 private:
  Testing::FakeSecurityScope scope_;
};
INSTANTIATE_TEST_SUITE_P(Fake, SecurityScopeContract, SecurityScopeContract::on<FakeWorld>());

}  // namespace
}  // namespace Varnel::Platform::Contract
