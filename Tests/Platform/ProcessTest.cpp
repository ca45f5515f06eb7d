// SPDX-License-Identifier: MIT
#include <dlfcn.h>
#include <fcntl.h>
#include <gtest/gtest.h>
#include <pthread.h>
#include <signal.h>
#include <stdlib.h>
#include <unistd.h>

#include <future>

#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Basalt/Executor.h>
#include <Varnel/Basalt/SerialQueue.h>
#include <Varnel/Platform/Concurrency/StartThread.h>
#include <Varnel/Platform/Linux/Adapters.h>
#include <Varnel/Platform/POSIX/Adapters.h>
#include <Varnel/Platform/POSIX/FileDescriptor.h>
#include <Varnel/Platform/POSIX/ImageFile.h>
#include <Varnel/Platform/POSIX/UserFolders.h>
#include <Varnel/Platform/Ports/ProcessInfo.h>
#include <Varnel/Platform/Ports/UserLocale.h>

namespace Varnel::Platform {
namespace {

namespace fs = std::filesystem;

struct Facts {
  std::string name;
  bool takesSignals = false;
  bool takesFaults = false;
};

Facts currentFacts() {
  char name[16] = "";
  ::pthread_getname_np(::pthread_self(), name, sizeof name);
  sigset_t blocked;
  ::pthread_sigmask(SIG_BLOCK, nullptr, &blocked);
  Facts facts{.name = name};
  for (const int signal : {SIGTERM, SIGINT, SIGCHLD, SIGPIPE, SIGUSR1, SIGRTMIN})
    facts.takesSignals |= ::sigismember(&blocked, signal) == 0;
  facts.takesFaults = ::sigismember(&blocked, SIGSEGV) == 0;
  return facts;
}

using Start = void (*)(std::function<void()> body);

Facts factsIn(const Start& start) {
  std::promise<Facts> facts;
  start([&] { facts.set_value(currentFacts()); });
  return facts.get_future().get();
}

TEST(StartThread, LeavesTheSignalsOfTheProcessToTheHost) {
  const struct {
    const char* name;
    Start start;
  } cases[] = {
      {"a-name-of-more", [](auto body) { startThread("a-name-of-more", body).join(); }},
      {"cut-at-fifteen-", [](auto body) { startThread("cut-at-fifteen-bytes", body).join(); }},
      {"serial", [](auto body) { Basalt::SerialQueue("serial").async(body); }},
      {"concurrent", [](auto body) { Basalt::globalConcurrentQueue()->execute(body); }},
  };
  for (const auto& [name, start] : cases) {
    const Facts facts = factsIn(start);
    EXPECT_EQ(facts.name, name);
    EXPECT_FALSE(facts.takesSignals) << name;
    EXPECT_TRUE(facts.takesFaults) << name;
  }
  EXPECT_TRUE(currentFacts().takesSignals) << "the caller goes on as before";
}

// A host may have closed its standard streams: what it prints then must go into no file of ours.
TEST(FileDescriptor, IsNoStandardStream) {
  const POSIX::FileDescriptor input(::dup(STDIN_FILENO));
  ::close(STDIN_FILENO);
  const POSIX::FileDescriptor file(::open("/", O_RDONLY | O_CLOEXEC));
  EXPECT_GT(file.get(), STDERR_FILENO);
  EXPECT_EQ(::fcntl(file.get(), F_GETFD), FD_CLOEXEC);
  EXPECT_EQ(::fcntl(STDIN_FILENO, F_GETFD), -1);
  ::dup2(input.get(), STDIN_FILENO);
}

TEST(ProcessInfo, KnowsItsExecutable) {
  const Tests::TemporaryFolder root;
  const fs::path link = root.path() / "proc/self/exe";
  const std::string real = root.write("orvane (deleted)", "").string();
  fs::create_directories(link.parent_path());
  const std::pair<std::string, std::string> cases[] = {
      {"/opt/orvane", "/opt/orvane"},
      {"/opt/orvane (deleted)", "/opt/orvane"},
      {real, real},
  };
  for (const auto& [target, executable] : cases) {
    fs::remove(link);
    fs::create_symlink(target, link);
    EXPECT_EQ(Linux::makeProcessInfo(root.path().string())->executablePath(), executable);
  }
  EXPECT_EQ(Linux::makeProcessInfo("/without-proc")->executablePath(),
            fs::read_symlink("/proc/self/exe"));
}

TEST(ImageFile, IsKnownWhereverTheProcessHasGoneSince) {
  const fs::path before = fs::current_path();
  const Tests::TemporaryFolder folder;
  const fs::path copy = fs::canonical(folder.path()) / "copy.so";
  fs::copy_file(POSIX::imageFile(::dlsym(RTLD_DEFAULT, "erf")), copy);
  fs::current_path(folder.path());
  void* const library = ::dlopen("./copy.so", RTLD_NOW | RTLD_LOCAL);
  fs::current_path(before);
  ASSERT_NE(library, nullptr);
  EXPECT_EQ(POSIX::imageFile(::dlsym(library, "erf")), copy);
  ::dlclose(library);
}

TEST(UserFolders, HoldTheFilesOfAnIdentifierAndOfNoOther) {
  ::setenv("HOME", "/moved//", 1);
  ::setenv("XDG_DATA_HOME", "relative", 1);
  EXPECT_EQ(POSIX::userDataFolder(), "/moved/.local/share");
  ::setenv("HOME", "/home/ada", 1);
  ::setenv("XDG_CONFIG_HOME", "", 1);
  ::setenv("XDG_STATE_HOME", "relative", 1);
  EXPECT_EQ(POSIX::settingsFolder("com.a.B"), "/home/ada/.config/com.a.B");
  EXPECT_EQ(POSIX::analyticsSpool("com.a.B"), "/home/ada/.local/state/com.a.B/analytics.sqlite");
  ::setenv("XDG_CONFIG_HOME", "/c", 1);
  ::setenv("XDG_STATE_HOME", "/s", 1);
  EXPECT_EQ(POSIX::settingsFolder("com.a.B"), "/c/com.a.B");
  for (const char* path : {"..", ".", "", "/"})
    EXPECT_EQ(POSIX::notificationStore(path), "/s/_/notifications.sqlite") << path;
  EXPECT_EQ(POSIX::notificationStore("a/../b"), "/s/a_.._b/notifications.sqlite");
}

TEST(UserLocale, TakesDatesAndNumbersEachFromTheirCategory) {
  const struct {
    const char* all;
    const char* time;
    const char* numeric;
    const char* language;
    const char* dates;
    const char* numbers;
  } rows[] = {
      {"", "en_GB.UTF-8", "de_AT.UTF-8@euro", "fr_FR", "en_GB", "de_AT"},
      {"", "en_GB.UTF-8", "", "fr_FR", "en_GB", "fr_FR"},
      {"", "", "de_AT", "fr_FR", "fr_FR", "de_AT"},
      {"ja_JP", "en_GB", "de_AT", "fr_FR", "ja_JP", "ja_JP"},
      {"", "en_GB", "C", "fr_FR", "en_GB", "en_US"},
      {"", "", "", "", "en_US", "en_US"},
  };
  for (const auto& row : rows) {
    ::setenv("LC_ALL", row.all, 1);
    ::setenv("LC_TIME", row.time, 1);
    ::setenv("LC_NUMERIC", row.numeric, 1);
    ::setenv("LANG", row.language, 1);
    const auto locale = POSIX::makeUserLocale();
    EXPECT_EQ(locale->identifier(), row.dates) << &row - rows;
    EXPECT_EQ(locale->numberIdentifier(), row.numbers) << &row - rows;
  }
}

}  // namespace
}  // namespace Varnel::Platform
