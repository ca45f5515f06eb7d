// SPDX-License-Identifier: MIT
#include <cstdlib>
#include <fstream>
#include <vector>

#include <gtest/gtest.h>

#include <Tests/Context/PropertyLists.h>
#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Logging/Logger.h>
#include <Varnel/Modules/VarnelModule.h>

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

// The modules that the last `count` entries of the log speak of.
std::vector<std::string> lastEntries(std::size_t count) {
  Logger::instance().flush();
  std::ifstream log(Logger::instance().logFileURL()->path());
  std::vector<std::string> entries;
  for (std::string line; std::getline(log, line);)
    entries.push_back(line.substr(line.find(']') + 2));
  entries.erase(entries.begin(), entries.end() - static_cast<std::ptrdiff_t>(count));
  return entries;
}

TEST(Module, LogsOnceThatItIsThereHoweverItIsMade) {
  // A log of its own: other tests run at the same time.
  const Tests::TemporaryFolder home;
  ASSERT_EQ(::setenv("HOME", home.path().c_str(), 1), 0);
  Logger::instance().log("begin", "Test");
  const auto report = makeModule<ReportModule>(Bundle(std::nullopt, {}));
  const VarnelModule direct;
  const auto made = makeModule<VarnelModule>();
  EXPECT_EQ(report->identifier("window"), "report-module.window");
  const std::string framework = "VarnelModule:  Initalizing module " + direct.version();
  EXPECT_EQ(lastEntries(4),
            (std::vector<std::string>{"Test:  begin", "ReportModule:  Initalizing module undefined",
                                      framework, framework}));
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
