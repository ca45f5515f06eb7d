// SPDX-License-Identifier: MIT
#include <fstream>
#include <iterator>

#include <gtest/gtest.h>

#include <Tests/Context/PropertyLists.h>
#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Context/VarnelModule.h>
#include <Varnel/Logging/Logger.h>

namespace Varnel {
namespace {

class ReportModule final : public BaseModule {
 public:
  explicit ReportModule(Bundle bundle) { setBundle(std::move(bundle)); }
  using BaseModule::identifier;
  std::string identifier() const override { return "report-module"; }
  std::string typeName() const override { return "ReportModule"; }
};

TEST(Module, VersionNamesEachNumberThatIsMissing) {
  const Tests::TemporaryFolder folder;
  const auto versionWith = [&](const std::map<std::string, std::string>& info) {
    folder.write("Info.plist", Tests::propertyList(info));
    return ReportModule(Bundle(folder.path().string(), {})).version();
  };
  EXPECT_EQ(versionWith({{"CFBundleShortVersionString", "1.4"}, {"CFBundleVersion", "210"}}),
            "1.4 (210/undefined)");
  EXPECT_EQ(versionWith({{"QNSourceVersion", "9f3c"}}), "undefined (undefined/9f3c)");
  EXPECT_EQ(versionWith({}), "undefined (undefined/undefined)");

  ReportModule withoutBundle(Bundle(std::nullopt, {}));
  EXPECT_EQ(withoutBundle.version(), "undefined");
  withoutBundle.setVersion("3");
  EXPECT_EQ(withoutBundle.version(), "3");
}

TEST(Module, FactoryLogsWhatTheFinishedObjectSays) {
  const auto module = makeModule<ReportModule>(Bundle(std::nullopt, {}));
  EXPECT_EQ(module->identifier("window"), "report-module.window");
  Logger::instance().flush();
  std::ifstream log(Logger::instance().logFileURL()->path());
  const std::string entries((std::istreambuf_iterator<char>(log)), {});
  EXPECT_NE(entries.find("ReportModule:  Initalizing module undefined\n"), std::string::npos);
}

TEST(Module, FrameworkFindsItsOwnBundle) {
  const auto framework = VarnelModule::instance();
  EXPECT_EQ(framework->bundle().identifier(), "com.quennel.Varnel");
  EXPECT_NE(framework->version(), "undefined");
  EXPECT_EQ(framework->identifier("sounds"), "varnel-module.sounds");

  const auto other = makeModule<VarnelModule>();
  VarnelModule::setInstance(other);
  EXPECT_EQ(VarnelModule::instance(), other);
}

#ifndef NDEBUG
TEST(Module, BaseOperationsStopADebugBuild) {
  EXPECT_DEATH((void)BaseModule().identifier(), "abstract");
  EXPECT_DEATH((void)BaseModule().fetchBundle(), "abstract");
}
#endif

}  // namespace
}  // namespace Varnel
