// SPDX-License-Identifier: MIT
#include <Varnel/Provenance/KVDownloadSourceTracker.h>

#include <gmock/gmock.h>
#include <sys/wait.h>

#include <cerrno>

#include <Tests/Support/OpenDescriptors.h>
#include <Tests/Support/QuarantineDatabase.h>
#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Platform/Testing/FakePorts.h>
#include <Varnel/Provenance/EventFilters.h>

namespace Varnel {
namespace {

namespace fs = std::filesystem;
using Platform::URL;
using Tests::insertDownload;

// A machine with a database of downloads, an application, and another on a volume that is mounted
// from an image. The disk-image tool is a script, or a fake.
class DownloadSource : public testing::Test {
 protected:
  DownloadSource() {
    Tests::runSQL(database, Tests::createQuarantineTable() +
                                insertDownload("'other'", "'https://example.org/other'") +
                                insertDownload("'named'", "'https://example.org/ORVANE-_2.dmg'") +
                                insertDownload("'later'", "'https://example.org/orvane2.dmg'") +
                                insertDownload("'bundle'", "'https://example.org/bundle'") +
                                insertDownload("'image'", "'https://example.org/image'") +
                                insertDownload("''", "'https://example.org/empty'"));
    mountVolume(volume);
    fakes.volumeCatalog.setVolumeName(URL::fileURLWithPath(volume + "/"), "Orvane");
  }

  void mountVolume(const std::string& path) {
    fakes.volumeCatalog.setVolumes({{URL::fileURLWithPath(path + "/"), true, true, std::nullopt}});
  }

  void setAttribute(const std::string& path, const std::string& value) {
    fakes.extendedAttributes.values[{path, "com.apple.quarantine"}] = value;
  }
  void setEvent(const std::string& path, const std::string& event) {
    setAttribute(path, "0083;5f3a;Browser;" + event);
  }

  // A program that is run in place of the tool.
  void writeTool(const std::string& script) {
    const fs::path file = folder.write("tool", "#!/bin/sh\n" + script);
    fs::permissions(file, fs::perms::owner_all);
    ports.processLauncher = Platform::processPorts().processLauncher;
  }

  [[nodiscard]] std::string propertyList() const {
    return "<plist version=\"1.0\"><dict><key>images</key><array><dict>"
           "<key>image-path</key><string>" +
           image +
           "</string><key>system-entities</key><array><dict/><dict><key>mount-point</key><string>" +
           volume + "</string></dict></array></dict></array></dict></plist>";
  }
  [[nodiscard]] std::string printing(const std::string& text) const {
    return "[ \"$*\" = 'info -plist' ] || exit 9\ncat <<'END'\n" + text + "\nEND\n";
  }

  // The event that the application at `bundle`, or the running one, is traced to.
  std::string trace(std::optional<std::string> bundle,
                    std::optional<Platform::TimeInterval> toolTimeout = {}) {
    const KVDownloadSourceTracker tracker(
        std::make_shared<KVQuarantine>(database.string(), fakes.systemLog),
        {.diskImageTool = (folder.path() / "tool").string(),
         .volumesRoot = "/Volumes",
         .bundlePath = std::move(bundle),
         .toolTimeout = toolTimeout},
        KVDownloadSourceTracker::Ports::of(ports));
    const auto entry = tracker.installSourceEntry();
    return entry ? std::string(entry->eventIdentifier().value_or("?")) : "none";
  }

  const Tests::TemporaryFolder folder;
  const fs::path database = folder.path() / "events";
  const std::string application = "/Applications/Orvane.app";
  const std::string volume = "/Volumes/Orvane";
  const std::string mounted = volume + "/Orvane.app";
  const std::string image = "/home/ada/image.dmg";

  Platform::Testing::FakePorts fakes;
  Platform::Ports ports = fakes.ports();
};

TEST_F(DownloadSource, TheApplicationsOwnAttributeDecides) {
  const std::pair<const char*, const char*> cases[] = {
      {"0083;5f3a;Browser;bundle", "bundle"}, {"0083;5f3a;Browser;bundle;more", "bundle"},
      {"0083;5f3a;Browser;BUNDLE", "named"},  {"0083;5f3a;Browser;", ""},
      {"0083;5f3a;Browser", "named"},         {"0083;5f3a;Browser;\xFF", "named"},
  };
  EXPECT_EQ(trace(application), "named");
  for (const auto& [attribute, event] : cases) {
    setAttribute(application, attribute);
    EXPECT_EQ(trace(application), event) << attribute;
  }
  EXPECT_EQ(fakes.systemLog.text(), "");
}

TEST_F(DownloadSource, WithoutDownloadsThereIsNoSource) {
  setEvent(application, "bundle");
  Tests::runSQL(database, "DELETE FROM LSQuarantineEvent");
  EXPECT_EQ(trace(application), "none");
  KVDownloadSourceTracker tracker(
      std::make_shared<KVQuarantine>(database.string(), fakes.systemLog));
  tracker.setQuarantine(nullptr);
  EXPECT_FALSE(tracker.installSourceEntry());
}

TEST_F(DownloadSource, OnAMountedImageTheImagesAttributeDecides) {
  setEvent(mounted, "bundle");
  fakes.processLauncher.script.output = propertyList();
  EXPECT_EQ(trace(mounted), "bundle");  // the image has no attribute yet
  setEvent(image, "image");
  EXPECT_EQ(trace(mounted), "image");

  // The volume's name is taken for its folder's, whatever that is called.
  fakes.volumeCatalog.setVolumeName(URL::fileURLWithPath(volume + "/"), "Another");
  EXPECT_EQ(trace(mounted), "bundle");
  EXPECT_EQ(fakes.systemLog.text(), "");
}

TEST_F(DownloadSource, APathThatOnlyStartsLikeTheVolumesIsTakenForOne) {
  const std::string similar = "/VolumesX/Orvane.app";
  setEvent(similar, "bundle");
  mountVolume("");
  EXPECT_EQ(trace(similar), "bundle");
  EXPECT_EQ(fakes.processLauncher.launches.size(), 1u);
}

TEST_F(DownloadSource, AVolumeWithoutNameIsLoggedAndTheApplicationDecides) {
  setEvent(mounted, "bundle");
  fakes.volumeCatalog.setLookupError(Platform::PlatformError("Test", 1));
  EXPECT_EQ(trace(mounted), "bundle");
  EXPECT_THAT(fakes.systemLog.text(),
              testing::StartsWith("Cannot obtain volume name: Error Domain=Test"));
  fakes.volumeCatalog.setLookupError(std::nullopt);
  fakes.volumeCatalog.setVolumes({});
  EXPECT_EQ(trace(mounted), "bundle");
}

TEST_F(DownloadSource, AToolThatGivesNoAnswerLeavesTheApplicationToDecide) {
  setEvent(mounted, "bundle");
  setEvent(image, "image");
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
  fakes.processLauncher.script = {.output = propertyList(), .questions = 3};
  setEvent(image, "image");
  EXPECT_EQ(trace(mounted), "image");
  EXPECT_EQ(fakes.processLauncher.launches,
            (std::vector<std::vector<std::string>>{{folder.path() / "tool", "info", "-plist"}}));
  EXPECT_EQ(fakes.processLauncher.terminations, 0);

  // Without a bundle the executable stands for the application.
  fakes.processInfo.executable = application;
  setEvent(application, "bundle");
  EXPECT_EQ(trace(std::nullopt), "bundle");
}

// A fault may lead to a lesser source, as where the better one is not there. It does so once.
TEST_F(DownloadSource, AFaultLeadsToALesserSourceOnce) {
  using Platform::Testing::Fault;
  setEvent(image, "image");
  setEvent(mounted, "bundle");
  fakes.processLauncher.script.output = propertyList();
  for (const Fault fault : {Fault::fails, Fault::absent, Fault::delays}) {
    const bool isSlow = fault == Fault::delays;
    const auto calls = sweepFaults(fault, [&](const auto& faults) {
      fakes.processLauncher.faults = faults;
      if (!isSlow) fakes.extendedAttributes.faults = fakes.volumeCatalog.faults = faults;
      EXPECT_THAT(trace(mounted), testing::AnyOf("image", isSlow ? "image" : "bundle"));
      faults->mend();
      EXPECT_EQ(trace(mounted), "image");
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

}  // namespace
}  // namespace Varnel
