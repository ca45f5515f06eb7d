// SPDX-License-Identifier: MIT
#include <Varnel/Provenance/KVDownloadSourceTracker.h>

#include <gmock/gmock.h>
#include <sys/wait.h>

#include <cerrno>
#include <future>
#include <thread>

#include <Tests/Support/OpenDescriptors.h>
#include <Tests/Support/QuarantineDatabase.h>
#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Basalt/Executor.h>
#include <Varnel/Context/ApplicationData.h>
#include <Varnel/Platform/Ports/Ports.h>
#include <Varnel/Platform/Testing/CapturedOutput.h>
#include <Varnel/Platform/Testing/FakeExtendedAttributes.h>
#include <Varnel/Platform/Testing/FakeProcessInfo.h>
#include <Varnel/Platform/Testing/FakeProcessLauncher.h>
#include <Varnel/Platform/Testing/FakeUserDefaults.h>
#include <Varnel/Platform/Testing/FakeVolumeCatalog.h>
#include <Varnel/Provenance/EventFilters.h>

namespace Varnel {
namespace {

namespace fs = std::filesystem;
using Platform::URL;
using Tests::insertDownload;

// A machine on a temporary folder: its volumes, an application, downloads, and real attributes on
// real files. The disk-image tool is a script.
class DownloadSource : public testing::Test {
 protected:
  void SetUp() override {
    Tests::runSQL(database, Tests::createQuarantineTable() +
                                insertDownload("'other'", "'https://example.org/other'") +
                                insertDownload("'named'", "'https://example.org/ORVANE-_2.dmg'") +
                                insertDownload("'later'", "'https://example.org/orvane2.dmg'") +
                                insertDownload("'bundle'", "'https://example.org/bundle'") +
                                insertDownload("'image'", "'https://example.org/image'") +
                                insertDownload("''", "'https://example.org/empty'"));
    fs::create_directories(application);
    fs::create_directories(mounted);
    if (!Tests::setQuarantineAttribute(folder.write("probe", ""), "x"))
      GTEST_SKIP() << "The file system of " << folder.path() << " keeps no attributes.";
    folder.write("image.dmg", "");
    mountVolume(volume.string());
    volumes.setVolumeName(URL::fileURLWithPath(volume.string() + "/"), "Orvane");
  }

  void mountVolume(const std::string& path) {
    volumes.setVolumes({{URL::fileURLWithPath(path + "/"), true, true, std::nullopt}});
  }

  // A program that is run in place of the tool.
  void writeTool(const std::string& script) {
    const fs::path file = folder.write("tool", "#!/bin/sh\n" + script);
    fs::permissions(file, fs::perms::owner_all);
  }

  [[nodiscard]] std::string propertyList() const {
    return "<plist version=\"1.0\"><dict><key>images</key><array><dict>"
           "<key>image-path</key><string>" +
           image.string() +
           "</string><key>system-entities</key><array><dict/><dict><key>mount-point</key><string>" +
           volume.string() + "</string></dict></array></dict></array></dict></plist>";
  }
  [[nodiscard]] std::string printing(const std::string& text) const {
    return "[ \"$*\" = 'info -plist' ] || exit 9\ncat <<'END'\n" + text + "\nEND\n";
  }

  // The event that the application at `bundle` is traced to.
  std::string trace(const fs::path& bundle,
                    std::optional<Platform::TimeInterval> toolTimeout = {}) {
    const KVDownloadSourceTracker tracker(
        std::make_shared<KVQuarantine>(database.string(), log),
        {.diskImageTool = (folder.path() / "tool").string(),
         .volumesRoot = (folder.path() / "Volumes").string(),
         .bundlePath = bundle.string(),
         .toolTimeout = toolTimeout},
        {Platform::processPorts().extendedAttributes, processInfo,
         Platform::processPorts().processLauncher, log, userDefaults, volumes});
    const auto entry = tracker.installSourceEntry();
    return entry ? std::string(entry->eventIdentifier().value_or("?")) : "none";
  }

  const Tests::TemporaryFolder folder;
  const fs::path database = folder.path() / "events";
  const fs::path application = folder.path() / "Applications" / "Orvane.app";
  const fs::path volume = folder.path() / "Volumes" / "Orvane";
  const fs::path mounted = volume / "Orvane.app";
  const fs::path image = folder.path() / "image.dmg";

  Platform::Testing::CapturedSystemLog log;
  Platform::Testing::FakeProcessInfo processInfo;
  Platform::Testing::FakeUserDefaults userDefaults;
  Platform::Testing::FakeVolumeCatalog volumes;
};

TEST_F(DownloadSource, TheApplicationsOwnAttributeDecides) {
  const std::pair<const char*, const char*> cases[] = {
      {"0083;5f3a;Browser;bundle", "bundle"}, {"0083;5f3a;Browser;bundle;more", "bundle"},
      {"0083;5f3a;Browser;BUNDLE", "named"},  {"0083;5f3a;Browser;", ""},
      {"0083;5f3a;Browser", "named"},         {"0083;5f3a;Browser;\xFF", "named"},
  };
  EXPECT_EQ(trace(application), "named");
  for (const auto& [attribute, event] : cases) {
    ASSERT_TRUE(Tests::setQuarantineAttribute(application, attribute));
    EXPECT_EQ(trace(application), event) << attribute;
  }
  EXPECT_EQ(log.text(), "");
}

TEST_F(DownloadSource, WithoutDownloadsThereIsNoSource) {
  ASSERT_TRUE(Tests::setQuarantineAttribute(application, "0083;5f3a;Browser;bundle"));
  Tests::runSQL(database, "DELETE FROM LSQuarantineEvent");
  EXPECT_EQ(trace(application), "none");
  KVDownloadSourceTracker tracker(std::make_shared<KVQuarantine>(database.string(), log));
  tracker.setQuarantine(nullptr);
  EXPECT_FALSE(tracker.installSourceEntry());
}

TEST_F(DownloadSource, OnAMountedImageTheImagesAttributeDecides) {
  ASSERT_TRUE(Tests::setQuarantineAttribute(mounted, "0083;5f3a;Browser;bundle"));
  writeTool(printing(propertyList()));
  EXPECT_EQ(trace(mounted), "bundle");  // the image has no attribute yet
  ASSERT_TRUE(Tests::setQuarantineAttribute(image, "0083;5f3a;Browser;image"));
  EXPECT_EQ(trace(mounted), "image");

  // The volume's name is taken for its folder's, whatever that is called.
  volumes.setVolumeName(URL::fileURLWithPath(volume.string() + "/"), "Another");
  EXPECT_EQ(trace(mounted), "bundle");
  EXPECT_EQ(log.text(), "");
}

TEST_F(DownloadSource, APathThatOnlyStartsLikeTheVolumesIsTakenForOne) {
  const fs::path similar = folder.path() / "VolumesX" / "Orvane.app";
  fs::create_directories(similar);
  ASSERT_TRUE(Tests::setQuarantineAttribute(similar, "0083;5f3a;Browser;bundle"));
  writeTool("touch '" + (folder.path() / "asked").string() + "'");
  mountVolume(folder.path().string());
  EXPECT_EQ(trace(similar), "bundle");
  EXPECT_TRUE(fs::exists(folder.path() / "asked"));
}

TEST_F(DownloadSource, AVolumeWithoutNameIsLoggedAndTheApplicationDecides) {
  ASSERT_TRUE(Tests::setQuarantineAttribute(mounted, "0083;5f3a;Browser;bundle"));
  volumes.setLookupError(Platform::PlatformError("Test", 1));
  EXPECT_EQ(trace(mounted), "bundle");
  EXPECT_THAT(log.text(), testing::StartsWith("Cannot obtain volume name: Error Domain=Test"));
  volumes.setLookupError(std::nullopt);
  volumes.setVolumes({});
  EXPECT_EQ(trace(mounted), "bundle");
}

TEST_F(DownloadSource, AToolThatGivesNoAnswerLeavesTheApplicationToDecide) {
  ASSERT_TRUE(Tests::setQuarantineAttribute(mounted, "0083;5f3a;Browser;bundle"));
  ASSERT_TRUE(Tests::setQuarantineAttribute(image, "0083;5f3a;Browser;image"));
  const std::string answer = printing(propertyList());
  const struct {
    const char* name;
    std::string script;
    std::optional<double> timeout;
    const char* event;
  } cases[] = {
      {"slow", "sleep 0.2\n" + answer, {}, "image"},
      {"complaining", "echo trouble >&2\n" + answer, {}, "image"},
      {"failing", answer + "exit 1\n", {}, "image"},
      {"killed", answer + "kill -9 $$\n", {}, "image"},
      {"failing in the midst",
       answer.substr(0, answer.find("<key>system")) + "\nEND\nexit 1\n",
       {},
       "bundle"},
      {"garbage", "head -c 70000 /dev/urandom\n", {}, "bundle"},
      {"silent", "", {}, "bundle"},
      {"another list",
       printing("<plist><array><string>images</string></array></plist>"),
       {},
       "bundle"},
      // Larger than any pipe: it waits for a reader that never comes.
      {"verbose", answer + "head -c 9000000 /dev/zero\n", 0.3, "bundle"},
      {"endless", "yes\n", 0.3, "bundle"},
      {"asleep", "sleep 1000\n", 0.3, "bundle"},
      {"reading", "cat\n", 0.3, "bundle"},
      {"deaf", "trap '' TERM INT HUP\nwhile :; do :; done\n", 0.3, "bundle"},
      {"gone elsewhere", "exec perl -e 'setpgrp(0, getpgrp(getppid())); sleep 1000'\n", 0.3,
       "bundle"},
      // What it leaves behind keeps the pipe open, and is not waited for.
      {"with a child", "sleep 2 2>/dev/null &\n" + answer, {}, "image"},
  };
  testing::internal::CaptureStderr();
  static_cast<void>(Platform::processPorts());  // They stay, with a descriptor of their own.
  const auto descriptors = Tests::openDescriptors();
  for (const auto& each : cases) {
    writeTool(each.script);
    EXPECT_EQ(trace(mounted, each.timeout), each.event) << each.name;
    EXPECT_EQ(Tests::openDescriptors(), descriptors) << each.name;
    // Neither a child nor a zombie.
    EXPECT_EQ(::waitpid(-1, nullptr, WNOHANG), -1) << each.name;
    EXPECT_EQ(errno, ECHILD);
  }
  fs::remove(folder.path() / "tool");
  EXPECT_EQ(trace(mounted), "bundle");
  folder.write("tool", "not a program");
  EXPECT_EQ(trace(mounted), "bundle");
  EXPECT_EQ(Tests::openDescriptors(), descriptors);
  EXPECT_THAT(testing::internal::GetCapturedStderr(), testing::HasSubstr("trouble\n"));
}

TEST_F(DownloadSource, AToolIsAskedUntilItHasEnded) {
  Platform::Testing::FakeProcessLauncher launcher;
  launcher.script = {.output = propertyList(), .questions = 3};
  ASSERT_TRUE(Tests::setQuarantineAttribute(image, "0083;5f3a;Browser;image"));
  const KVDownloadSourceTracker tracker(
      std::make_shared<KVQuarantine>(database.string(), log),
      {.volumesRoot = (folder.path() / "Volumes").string(), .bundlePath = mounted.string()},
      {Platform::processPorts().extendedAttributes, processInfo, launcher, log, userDefaults,
       volumes});
  EXPECT_EQ(tracker.installSourceEntry()->eventIdentifier(), "image");
  EXPECT_EQ(launcher.launches,
            (std::vector<std::vector<std::string>>{{"/usr/bin/hdiutil", "info", "-plist"}}));
  EXPECT_EQ(launcher.terminations, 0);

  // Without a bundle the executable stands for the application.
  processInfo.executable = application.string();
  ASSERT_TRUE(Tests::setQuarantineAttribute(application, "0083;5f3a;Browser;bundle"));
  const KVDownloadSourceTracker ofProcess(tracker.quarantine(), {},
                                          {Platform::processPorts().extendedAttributes, processInfo,
                                           launcher, log, userDefaults, volumes});
  EXPECT_EQ(ofProcess.installSourceEntry()->eventIdentifier(), "bundle");
  EXPECT_EQ(ofProcess.userDefaults().get(), &userDefaults);
}

// A fault may lead to a lesser source, as where the better one is not there. It does so once.
TEST_F(DownloadSource, AFaultLeadsToALesserSourceOnce) {
  using Platform::Testing::Fault;
  Platform::Testing::FakeExtendedAttributes attributes;
  attributes.values[{image.string(), "com.apple.quarantine"}] = "0083;5f3a;Browser;image";
  attributes.values[{mounted.string(), "com.apple.quarantine"}] = "0083;5f3a;Browser;bundle";
  for (const Fault fault : {Fault::fails, Fault::absent, Fault::delays}) {
    const bool isSlow = fault == Fault::delays;
    Platform::Testing::FakeProcessLauncher launcher;
    launcher.script.output = propertyList();
    const KVDownloadSourceTracker tracker(
        std::make_shared<KVQuarantine>(database.string(), log),
        {.volumesRoot = (folder.path() / "Volumes").string(), .bundlePath = mounted.string()},
        {attributes, processInfo, launcher, log, userDefaults, volumes});
    const auto calls = sweepFaults(fault, [&](const auto& faults) {
      launcher.faults = faults;
      if (!isSlow) attributes.faults = volumes.faults = faults;
      const auto entry = tracker.installSourceEntry();
      ASSERT_TRUE(entry);
      EXPECT_THAT(std::string(entry->eventIdentifier().value_or("?")),
                  testing::AnyOf("image", isSlow ? "image" : "bundle"));
      faults->mend();
      EXPECT_EQ(tracker.installSourceEntry()->eventIdentifier(), "image");
    });
    EXPECT_GE(calls, isSlow ? 1u : 4u);
  }
}

TEST(DownloadSourceFilters, TheProductsNameIsFoundInAnyCaseAndSpacing) {
  const auto passes = [](std::string url) {
    return nameFilter()(
        KVQuarantineEntry::entryWithDictionary({{"LSQuarantineDataURLString", std::move(url)}}));
  };
  for (const char* url :
       {"orvane2", "https://example.org/Orvane-2.zip", "ORVANE__--2", "Orvane \t\n2",
        "orvane\u00A0\u20032", "orvaneorvane 2", "xorvane_2x", "orvane1 orvane2"})
    EXPECT_TRUE(passes(url)) << url;
  for (const char* url :
       {"", "orvane", "orvane1", "orvane.2", "orvane%202", "orvan2", "2orvane-", "orvane-\xC2"})
    EXPECT_FALSE(passes(url)) << url;
  EXPECT_FALSE(nameFilter()(KVQuarantineEntry::entryWithDictionary({})));
  EXPECT_FALSE(eventIdentifierFilter("")(KVQuarantineEntry::entryWithDictionary({})));
}

TEST(DownloadSourceFilters, TheNewestIsTakenAndOfEquallyNewOnesTheFirst) {
  const auto entry = [](const char* identifier, double timestamp) {
    return KVQuarantineEntry::entryWithDictionary(
        {{"LSQuarantineEventIdentifier", identifier}, {"LSQuarantineTimeStamp", timestamp}});
  };
  const std::vector entries = {entry("a", 1), entry("b", 3), entry("c", 3), entry("d", 2)};
  const auto all = [](const auto&) { return true; };
  EXPECT_EQ(filterEvent(entries, all)->eventIdentifier(), "b");
  EXPECT_FALSE(filterEvent(entries, [](const auto&) { return false; }));
}

TEST(SharedTracker, IsOneAndHoldsWhatClientsNeed) {
  const auto tracker = KVDownloadSourceTracker::sharedTracker();
  EXPECT_EQ(tracker, KVDownloadSourceTracker::sharedTracker());
  EXPECT_EQ(tracker->quarantine()->path(), KVQuarantine::systemQuarantinePathV2());
  EXPECT_EQ(tracker->userDefaults().get(), &ApplicationData::settings());
  std::promise<std::thread::id> ran;
  tracker->privateQueue()->execute([&] { ran.set_value(std::this_thread::get_id()); });
  EXPECT_NE(ran.get_future().get(), std::this_thread::get_id());
}

}  // namespace
}  // namespace Varnel
