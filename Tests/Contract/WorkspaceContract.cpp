// SPDX-License-Identifier: MIT
#include <Tests/Contract/UserWorlds.h>

#include <Varnel/Platform/Testing/FakeWorkspace.h>

namespace Varnel::Platform::Contract {
namespace {

TEST_P(WorkspaceContract, FindsWhatIsInstalledAtThatMomentUnderExactlyThisIdentifier) {
  Workspace& workspace = world->workspace();
  EXPECT_EQ(workspace.applicationURL("com.quennel.Velt"), std::nullopt);
  const URL program = world->install("com.quennel.Velt", false);
  const URL bundle = world->install("com.quennel.Orvane2", true);
  EXPECT_EQ(workspace.applicationURL("com.quennel.Velt"), program);
  EXPECT_EQ(workspace.applicationURL("com.quennel.Orvane2"), bundle);
  EXPECT_TRUE(bundle.hasDirectoryPath());
  for (const char* other : {"com.quennel.velt", "com.quennel.Velt ", "Velt", "com.quennel.*",
                            "./com.quennel.Velt", "com.quennel", ""})
    EXPECT_EQ(workspace.applicationURL(other), std::nullopt) << other;
  world->remove("com.quennel.Velt");
  EXPECT_EQ(workspace.applicationURL("com.quennel.Velt"), std::nullopt);
  EXPECT_EQ(workspace.applicationURL("com.quennel.Orvane2"), bundle);
}

class FakeWorld final : public WorkspaceWorld {
 public:
  FakeWorld() { workspace_.applications.emplace("", URL::fileURLWithPath("/opt/nobody's")); }
  Workspace& workspace() override { return workspace_; }
  URL install(const std::string& identifier, bool hasBundle) override {
    const URL url = URL::fileURLWithPath("/opt/" + identifier + (hasBundle ? "/" : ""));
    workspace_.applications.emplace(identifier, url);
    return url;
  }
  void remove(const std::string& identifier) override { workspace_.applications.erase(identifier); }

 private:
  Testing::FakeWorkspace workspace_;
};

INSTANTIATE_TEST_SUITE_P(Fake, WorkspaceContract, WorkspaceContract::on<FakeWorld>());

}  // namespace
}  // namespace Varnel::Platform::Contract
