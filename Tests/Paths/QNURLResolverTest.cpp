// SPDX-License-Identifier: MIT
#include <Varnel/Paths/QNURLResolver.h>

#include <gtest/gtest.h>

#include <random>

#include <Tests/Support/TemporaryFolder.h>
#include <Varnel/Platform/Text/KeyedArchive.h>

namespace Varnel {
namespace {

using Platform::PathComponents;
using Platform::URL;

QNURLResolver resolver(const char* home = "/Users/ann/", const char* root = "/") {
  return QNURLResolver(URL::fileURLWithPath(home), URL::fileURLWithPath(root));
}

TEST(QNURLResolver, AbbreviatesPaths) {
  const std::pair<const char*, const char*> cases[] = {
      {"/Users/ann/Documents/", "~/Documents/"},
      {"/Users//ann///Documents//", "~/Documents/"},
      {"/Users/ann", "~"},
      {"/Users/ann/", "~"},
      {"/users/ann/x", "/users/ann/x"},
      {"/", "/"},
      {"", ""},
      {"~/x", "~/x"},
      {"docs/", "docs/"},
      {"/Users/ann/../bob", "~/../bob"},
  };
  for (const auto& [path, expected] : cases)
    EXPECT_EQ(resolver().abbreviatedPath(path), expected) << path;
  EXPECT_EQ(resolver().abbreviatedPath("/Users/ann", true), "~");
  EXPECT_EQ(resolver().abbreviatedPath("/Applications/Mail.app", true), "/Applications/Mail.app/");
  EXPECT_EQ(resolver().abbreviatedPath("/Users/ann/Music/", false), "~/Music");
  EXPECT_EQ(resolver().abbreviatedPath("", true), "");
}

TEST(QNURLResolver, ExpandsShortForms) {
  const std::pair<const char*, const char*> cases[] = {
      {"~/Music/", "/Users/ann/Music"},
      {"~", "/Users/ann"},
      {"~/", "/Users/ann"},
      {"/", "/"},
      {"/usr/lib/", "/usr/lib"},
      {"docs/a.txt", "docs/a.txt"},
      {"~bob/x", "~bob/x"},
      {"./~/x", "./~/x"},
  };
  for (const auto& [path, expected] : cases)
    EXPECT_EQ(resolver().expandedPathForPath(path), expected) << path;
  EXPECT_EQ(resolver().expandedPathForPath(""), std::nullopt);
  EXPECT_EQ(resolver().expandedPathComponentsForPath(""), std::nullopt);
  EXPECT_EQ(resolver().expandedPathComponentsForPath("~/"), (PathComponents{"/", "Users", "ann"}));
  EXPECT_EQ(resolver().expandedPathComponentsForPath("docs/"), (PathComponents{"docs", "/"}));
  EXPECT_EQ(resolver("", "").expandedPathForPath("~"), std::nullopt);
}

TEST(QNURLResolver, GivesTheBasesThemselvesForTheirSigns) {
  const QNURLResolver backup = resolver("/Users/ann/", "/Volumes/Backup/");
  EXPECT_EQ(backup.fileURLWithPath("~"), backup.homeURL());
  EXPECT_EQ(backup.fileURLWithPath("/"), backup.rootURL());
  EXPECT_EQ(backup.fileURLWithPath("//"), backup.rootURL());
  EXPECT_EQ(backup.fileURLWithPath("~/"), URL::fileURLWithPath("/Users/ann"));
  EXPECT_EQ(backup.fileURLWithPath("~/Music/"), URL::fileURLWithPath("/Users/ann/Music"));
  EXPECT_EQ(backup.fileURLWithPath("/x"), URL::fileURLWithPath("/Volumes/Backup/x"));
  EXPECT_EQ(backup.fileURLWithPath("docs/a b"), URL::fileURLWithPath("docs/a b"));
  EXPECT_EQ(backup.fileURLWithPath(""), std::nullopt);
}

TEST(QNURLResolver, ShowsPathsBelowAnotherRootFromItsSlash) {
  const QNURLResolver backup = resolver("/Users/ann/", "/Volumes/Backup");
  EXPECT_EQ(backup.abbreviatedPath("/Volumes/Backup/x"), "/x");
  EXPECT_EQ(backup.abbreviatedPath("/Volumes/Backup/"), "/");
  EXPECT_EQ(backup.abbreviatedPath("/Volumes/Backups"), "/Volumes/Backups");
  EXPECT_EQ(backup.abbreviatedPathComponentsForPath("/Volumes/Backup/x/"),
            (PathComponents{"/", "x"}));
  EXPECT_EQ(backup.abbreviatedPathComponentsForPath(""), PathComponents{});
}

TEST(QNURLResolver, AsksAURLForItsKindUnlessTheHintSaysFolder) {
  const Tests::TemporaryFolder folder;
  folder.write("a.txt", "");
  const std::string path = folder.path();
  const QNURLResolver there = resolver(path.c_str());
  const auto abbreviated = [&](const std::string& name, std::optional<bool> hint = {}) {
    return there.abbreviatedPathForURL(URL::fileURLWithPath(path + name), hint);
  };
  EXPECT_EQ(abbreviated("/a.txt"), "~/a.txt");
  EXPECT_EQ(abbreviated("/a.txt", true), "~/a.txt/");
  EXPECT_EQ(abbreviated("/gone/"), "~/gone/");
  EXPECT_EQ(abbreviated("/gone"), "~/gone");
  EXPECT_EQ(abbreviated("", false), "~");
  // A false hint is no hint: the file system knows better.
  EXPECT_EQ(resolver().abbreviatedPathForURL(URL::fileURLWithPath(path), false), path + "/");
  EXPECT_EQ(resolver().abbreviatedPathForURL(URL::fileURLWithPath("")), std::nullopt);
  EXPECT_EQ(resolver().abbreviatedPathComponentsForURL(URL::fileURLWithPath("")), std::nullopt);
}

TEST(QNURLResolver, StripsWithoutComparingAndAbbreviatesOnlyBelowTheBase) {
  const PathComponents base = {"/", "a"};
  EXPECT_EQ(QNURLResolver::stripBaseFromPath("/x/b", base), PathComponents{"b"});
  EXPECT_EQ(QNURLResolver::stripBaseFromPath("/x/b", base, "~"), (PathComponents{"~", "b"}));
  EXPECT_EQ(QNURLResolver::stripBaseFromPath("/x", base), PathComponents{});
  EXPECT_EQ(QNURLResolver::stripBaseFromPath("/", base), std::nullopt);
  EXPECT_EQ(QNURLResolver::abbreviatePath("/x/b", base), std::nullopt);
  EXPECT_EQ(QNURLResolver::abbreviatePath("/a/b/", base), (PathComponents{"b", "/"}));
  EXPECT_EQ(QNURLResolver::abbreviateComponents({"b"}, {}, "~"), (PathComponents{"~", "b"}));
  EXPECT_EQ(resolver().abbreviatedPathForComponents({}, true), std::nullopt);
}

TEST(QNURLResolver, ComesBackFromItsArchiveAndFromNothingElse) {
  const QNURLResolver original = resolver("/Users/anné <&> b/", "/Volumes/\xFF/");
  Platform::KeyedArchiver archiver;
  original.encode(archiver);
  const auto decode = [](std::string_view bytes) -> std::optional<QNURLResolver> {
    const auto archive = Platform::KeyedUnarchiver::open(bytes);
    return archive ? QNURLResolver::decode(*archive) : std::nullopt;
  };
  const std::string bytes = archiver.bytes();
  const auto decoded = decode(bytes);
  ASSERT_TRUE(decoded);
  EXPECT_EQ(*decoded, original);
  EXPECT_EQ(decoded->homeURL(), original.homeURL());
  EXPECT_EQ(decoded->rootURL(), original.rootURL());

  for (std::size_t length = 0; length < bytes.find("rootURL"); length += 7)
    EXPECT_FALSE(decode(bytes.substr(0, length))) << length;
  const auto replaced = [&](std::string_view what, std::string_view by) {
    std::string changed = bytes;
    return changed.replace(changed.find(what), what.size(), by);
  };
  EXPECT_FALSE(decode(replaced("homeURL", "homeUrl")));
  EXPECT_FALSE(decode(replaced("file:///Users", "http://Users")));
  EXPECT_FALSE(decode(replaced("file:///Users", "file://host/Users")));
  EXPECT_FALSE(decode(replaced("file:///Users", "file:///%00")));
  EXPECT_FALSE(decode(replaced("file:///Users", "file:///Us ers")));
  EXPECT_FALSE(decode("<plist version=\"1.0\"><array/></plist>"));
}

TEST(QNURLResolver, IsEqualWhenTheBasesAreAndHashesAlike) {
  EXPECT_EQ(resolver("/Users/ann"), resolver("/Users//ann/"));
  EXPECT_EQ(resolver("/Users/ann").hash(), resolver("/Users//ann/").hash());
  EXPECT_NE(resolver("/Users/ann"), resolver("/Users/Ann"));
  EXPECT_NE(resolver("/a", "/b"), resolver("/b", "/a"));
  EXPECT_NE(resolver("/a", "/b").hash(), resolver("/b", "/a").hash());
  EXPECT_EQ(QNURLResolver::shared().rootURL(), URL::fileURLWithPath("/"));
}

// Paths of few short names, so that they often meet the bases and each other's beginnings.
class RandomPaths {
 public:
  std::string absolute() { return "/" + relative(0, 6); }

  std::string relative(int least, int most) {
    static constexpr const char* names[] = {"Users", "ann", "annie",    "~",
                                            ".",     "..",  "\xC3\xA9", "a b"};
    std::string path;
    for (int count = pick(least, most); count > 0; --count) {
      if (!path.empty()) path += '/';
      path += names[pick(0, 7)];
    }
    return path;
  }

  int pick(int least, int most) { return std::uniform_int_distribution<int>(least, most)(engine_); }

 private:
  std::mt19937 engine_{20260314};
};

TEST(QNURLResolver, ExpandingAnAbbreviationGivesThePathBack) {
  RandomPaths random;
  for (int i = 0; i < 20'000; ++i) {
    const std::string home = random.absolute();
    const std::string root = i % 2 ? "/" : random.absolute();
    const QNURLResolver bases = resolver(home.c_str(), root.c_str());
    const std::string& base = random.pick(0, 1) ? home : root;
    const std::string below = random.relative(0, 3);
    const std::string path = below.empty() ? base : base + (base == "/" ? "" : "/") + below;
    const std::string abbreviated = bases.abbreviatedPath(path);
    ASSERT_EQ(bases.expandedPathForPath(abbreviated), path)
        << home << " and " << root << " gave " << abbreviated;
    ASSERT_EQ(bases.abbreviatedPath(path, true),
              abbreviated.size() == 1 && (abbreviated == "~" || abbreviated == "/")
                  ? abbreviated
                  : abbreviated + "/");
    // With slashes strewn in, the text is abbreviated as its components are.
    std::string untidy;
    for (const char c : path)
      untidy.append(c == '/' ? static_cast<std::size_t>(random.pick(1, 3)) : 1, c);
    ASSERT_EQ(bases.abbreviatedPath(untidy, false),
              bases.abbreviatedPathForComponents(Platform::pathComponents(untidy), false))
        << untidy;
  }
}

}  // namespace
}  // namespace Varnel
