// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>
#include <pwd.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <clocale>
#include <cstdlib>
#include <cstring>
#include <string>
#include <utility>
#include <vector>

#include "tests/support/folder_fixture.h"
#include "tests/support/in_child.h"
#include "vexa/runtime.h"

namespace vexa_test {
namespace {

using Paths = std::vector<std::string>;

struct Found {
  int result = 1;
  Paths paths;
};

Found find(const std::string& pattern, int flags = 0, int (*on_error)(const char*, int) = nullptr) {
  Found found;
  pathglob_t matches;
  std::memset(&matches, 0x5A, sizeof matches);
  found.result = pathglob(pattern.c_str(), flags, on_error, &matches);
  for (std::size_t i = 0; i < matches.matchCount; ++i) found.paths.emplace_back(matches.paths[i]);
  EXPECT_TRUE(matches.paths == nullptr || matches.paths[matches.matchCount] == nullptr);
  pathglobfree(&matches);
  EXPECT_EQ(matches.matchCount, 0U);
  EXPECT_EQ(matches.paths, nullptr);
  return found;
}

/// What `pattern` finds in `folder`, without the folder's name.
Paths names(const TemporaryFolder& folder, const std::string& pattern, int flags = 0) {
  Paths found = find(folder / pattern, flags).paths;
  for (std::string& path : found) path.erase(0, folder.path().size() + 1);
  return found;
}

/// The variable HOME, changed for the length of a test.
class Home {
 public:
  explicit Home(const char* value) : former_(std::getenv("HOME") == nullptr ? "" : std::getenv("HOME")) {
    if (value != nullptr) {
      setenv("HOME", value, 1);
    } else {
      unsetenv("HOME");
    }
  }
  ~Home() { setenv("HOME", former_.c_str(), 1); }
  Home(const Home&) = delete;
  Home& operator=(const Home&) = delete;

 private:
  std::string former_;
};

/// A home directory out of the password database; the calling user's for an empty name.
std::string home_of(const std::string& user) {
  passwd entry{};
  passwd* found = nullptr;
  std::vector<char> room(65536);
  if (user.empty()) {
    getpwuid_r(getuid(), &entry, room.data(), room.size(), &found);
  } else {
    getpwnam_r(user.c_str(), &entry, room.data(), room.size(), &found);
  }
  return found == nullptr ? "" : found->pw_dir;
}

using PathGlob = InTemporaryFolder;

TEST_F(PathGlob, ResultsAndFlagsHaveTheirNumbers) {
  EXPECT_EQ(PATHGLOB_NOSPACE, -1);
  EXPECT_EQ(PATHGLOB_ABORTED, -2);
  EXPECT_EQ(PATHGLOB_NOMATCH, -3);
  EXPECT_EQ(PATHGLOB_ERR, 0x04);
  EXPECT_EQ(PATHGLOB_MARK, 0x08);
  EXPECT_EQ(PATHGLOB_NOCHECK, 0x10);
  EXPECT_EQ(PATHGLOB_NOSORT, 0x20);
}

TEST_F(PathGlob, GivesMinusThreeWhenNothingMatches) {
  folder_.make_file("a");
  for (const char* pattern : {"b", "b*", "?b", "b/*", "a/*", "a/", "*/", "[b]", "a\\", "\\a"}) {
    const Found found = find(folder_ / pattern);
    EXPECT_EQ(found.result, -3) << pattern;
    EXPECT_EQ(found.paths, Paths()) << pattern;
  }
  EXPECT_EQ(find("").result, -3);
}

TEST_F(PathGlob, FindsPathsWithoutMetaCharacters) {
  folder_.make_folder("sub");
  EXPECT_EQ(find(folder_ / "sub").paths, Paths{folder_ / "sub"});
  EXPECT_EQ(find(folder_ / "sub/").paths, Paths{folder_ / "sub/"});
  EXPECT_EQ(find(folder_ / "sub/..//sub").paths, Paths{folder_ / "sub/..//sub"});
  EXPECT_EQ(find("/").paths, Paths{"/"});
}

TEST_F(PathGlob, FindsAlongSeveralComponents) {
  folder_.make_folder("a1/x/deep");
  folder_.make_folder("a2/x");
  folder_.make_folder("b1/x");
  folder_.make_file("a1/x/f.txt");
  folder_.make_file("a2/x/g.txt");
  folder_.make_file("b1/x/h.txt");
  folder_.make_file("a3");
  EXPECT_EQ(names(folder_, "a*/x/*.txt"), (Paths{"a1/x/f.txt", "a2/x/g.txt"}));
  EXPECT_EQ(names(folder_, "*/x/[gh].*"), (Paths{"a2/x/g.txt", "b1/x/h.txt"}));
  EXPECT_EQ(names(folder_, "a?/*/deep"), (Paths{"a1/x/deep"}));
  EXPECT_EQ(names(folder_, "a*/"), (Paths{"a1/", "a2/"}));
  EXPECT_EQ(names(folder_, "a1//x///*"), (Paths{"a1//x///deep", "a1//x///f.txt"}));
  EXPECT_EQ(names(folder_, "a1/./x/../x/d*"), (Paths{"a1/./x/../x/deep"}));
  EXPECT_EQ(names(folder_, "*"), (Paths{"a1", "a2", "a3", "b1"}));
}

TEST_F(PathGlob, SetEndsWithItsComponent) {
  folder_.make_folder("[a");
  folder_.make_file("[a/b]");
  EXPECT_EQ(names(folder_, "[a/b]"), Paths{"[a/b]"});
  EXPECT_EQ(names(folder_, "[a/?]"), Paths{"[a/b]"});
}

TEST_F(PathGlob, TakesABackslashAsItself) {
  folder_.make_file("a*");
  folder_.make_file("a\\x");
  EXPECT_EQ(names(folder_, "a\\*"), Paths{"a\\x"});
}

TEST_F(PathGlob, HiddenNamesNeedADot) {
  folder_.make_file(".hidden");
  folder_.make_file("seen");
  EXPECT_EQ(names(folder_, "*"), Paths{"seen"});
  EXPECT_EQ(names(folder_, "?hidden"), Paths());
  EXPECT_EQ(names(folder_, "[.]hidden"), Paths());
  EXPECT_EQ(names(folder_, ".*"), (Paths{".", "..", ".hidden"}));
}

TEST_F(PathGlob, FindsLinksThatPointNowhere) {
  ASSERT_EQ(symlink("nowhere", (folder_ / "link").c_str()), 0);
  EXPECT_EQ(names(folder_, "l*"), Paths{"link"});
  EXPECT_EQ(names(folder_, "link"), Paths{"link"});
}

TEST_F(PathGlob, FindsInTheWorkingFolder) {
  folder_.make_file("a");
  folder_.make_file("b");
  EXPECT_EQ(in_child([&] {
              if (chdir(folder_.path().c_str()) != 0) return std::string("no folder");
              std::string all;
              for (const std::string& path : find("*").paths) all += path + ";";
              return all;
            }),
            "a;b;");
}

TEST_F(PathGlob, ATildeIsTheVariableHome) {
  folder_.make_file("a");
  const Home home(folder_.path().c_str());
  EXPECT_EQ(find("~").paths, Paths{folder_.path()});
  EXPECT_EQ(find("~/a").paths, Paths{folder_ / "a"});
  EXPECT_EQ(find("~/*").paths, Paths{folder_ / "a"});
  EXPECT_EQ(find("~//a").paths, Paths{folder_.path() + "//a"});
}

TEST_F(PathGlob, AnEmptyHomeCountsAsSet) {
  const Home home("");
  EXPECT_EQ(find("~/").paths, Paths{"/"});
  EXPECT_EQ(find("~").result, -3);
}

TEST_F(PathGlob, WithoutHomeATildeIsThePasswordDatabases) {
  const Home home(nullptr);
  ASSERT_NE(home_of(""), "");
  EXPECT_EQ(find("~", PATHGLOB_NOCHECK).result, 0);
  EXPECT_EQ(find("~").paths, Paths{home_of("")});
}

TEST_F(PathGlob, ATildeAndANameAreThatUsersHome) {
  const Home home("/nowhere");
  EXPECT_EQ(find("~root").paths, Paths{home_of("root")});
  EXPECT_EQ(find("~root/").paths, Paths{home_of("root") + "/"});
  EXPECT_EQ(find("~roo[t]").result, -3);
}

TEST_F(PathGlob, ATildeAndAnUnknownNameStayAsTheyAre) {
  folder_.make_folder("~no-such-user");
  folder_.make_file("~no-such-user/a");
  EXPECT_EQ(in_child([&] {
              if (chdir(folder_.path().c_str()) != 0) return std::string("no folder");
              const Paths found = find("~no-such-user/*").paths;
              return found.empty() ? std::string("none") : found[0];
            }),
            "~no-such-user/a");
}

TEST_F(PathGlob, ATildeElsewhereIsItself) {
  folder_.make_file("~");
  folder_.make_file("a~");
  EXPECT_EQ(names(folder_, "*~"), (Paths{"a~", "~"}));
  EXPECT_EQ(names(folder_, "~"), Paths{"~"});
}

TEST_F(PathGlob, MetaCharactersOfAHomeDirectoryCount) {
  folder_.make_file("a");
  const Home home((folder_.path().substr(0, folder_.path().size() - 1) + "?").c_str());
  EXPECT_EQ(find("~/a").paths, Paths{folder_ / "a"});
}

TEST_F(PathGlob, SortsInTheOrderOfStrcoll) {
  Paths expected = {"B", "C", "_", "a", "b", "c", "1", "10", "2"};
  for (const std::string& name : expected) folder_.make_file(name);
  std::sort(expected.begin(), expected.end(),
            [](const std::string& a, const std::string& b) { return strcoll(a.c_str(), b.c_str()) < 0; });
  EXPECT_EQ(names(folder_, "*"), expected);
}

TEST_F(PathGlob, FollowsTheLocalesOrder) {
  for (const char* name : {"B", "a", "C", "b"}) folder_.make_file(name);
  const std::string report = in_child([&] {
    if (std::setlocale(LC_COLLATE, "en_US.UTF-8") == nullptr && std::setlocale(LC_COLLATE, "C.UTF-8") == nullptr) {
      return std::string("no locale");
    }
    Paths expected = {"B", "a", "C", "b"};
    std::sort(expected.begin(), expected.end(),
              [](const std::string& a, const std::string& b) { return strcoll(a.c_str(), b.c_str()) < 0; });
    return std::string(names(folder_, "*") == expected ? "as strcoll" : "otherwise");
  });
  EXPECT_EQ(report, "as strcoll");
}

TEST_F(PathGlob, WithoutSortingStillFindsAll) {
  for (const char* name : {"c", "a", "b"}) folder_.make_file(name);
  Paths found = names(folder_, "*", PATHGLOB_NOSORT);
  std::sort(found.begin(), found.end());
  EXPECT_EQ(found, (Paths{"a", "b", "c"}));
}

TEST_F(PathGlob, MarksFolders) {
  folder_.make_folder("sub");
  folder_.make_file("file");
  ASSERT_EQ(symlink("sub", (folder_ / "to_sub").c_str()), 0);
  ASSERT_EQ(symlink("nowhere", (folder_ / "to_nowhere").c_str()), 0);
  EXPECT_EQ(names(folder_, "*", PATHGLOB_MARK), (Paths{"file", "sub/", "to_nowhere", "to_sub/"}));
  EXPECT_EQ(names(folder_, "sub/", PATHGLOB_MARK), (Paths{"sub/"}));
}

TEST_F(PathGlob, ReturnsThePatternItselfOnRequest) {
  EXPECT_EQ(find(folder_ / "*", PATHGLOB_NOCHECK).paths, Paths{folder_ / "*"});
  EXPECT_EQ(find("~no-such-user", PATHGLOB_NOCHECK).paths, Paths{"~no-such-user"});
  EXPECT_EQ(find("", PATHGLOB_NOCHECK).paths, Paths{""});
  folder_.make_file("a");
  EXPECT_EQ(find(folder_ / "*", PATHGLOB_NOCHECK).paths, Paths{folder_ / "a"});
}

std::vector<std::pair<std::string, int>> told;

int go_on(const char* path, int code) {
  told.emplace_back(path, code);
  return 0;
}

int stop(const char* path, int code) {
  told.emplace_back(path, code);
  return 1;
}

TEST_F(PathGlob, CallsTheCallbackForFoldersItCannotRead) {
  told.clear();
  EXPECT_EQ(find(folder_ / "gone/*", 0, &go_on).result, -3);
  EXPECT_EQ(told, (std::vector<std::pair<std::string, int>>{{folder_ / "gone/", ENOENT}}));
  told.clear();
  EXPECT_EQ(find(folder_ / "gone/*", 0, &stop).result, -2);
  EXPECT_EQ(told, (std::vector<std::pair<std::string, int>>{{folder_ / "gone/", ENOENT}}));
  told.clear();
  EXPECT_EQ(find(folder_ / "gone/*", PATHGLOB_ERR, &go_on).result, -2);
  EXPECT_EQ(told.size(), 1U);
  EXPECT_EQ(find(folder_ / "gone/*", PATHGLOB_ERR).result, -2);
  EXPECT_EQ(find(folder_ / "gone/*").result, -3);
}

TEST_F(PathGlob, AFileOnTheWayIsNoFolderThatCannotBeRead) {
  folder_.make_file("a");
  folder_.make_folder("b");
  folder_.make_file("b/c");
  told.clear();
  EXPECT_EQ(find(folder_ / "*/*", PATHGLOB_ERR, &stop).paths, Paths{folder_ / "b/c"});
  EXPECT_TRUE(told.empty());
}

TEST_F(PathGlob, KeepsWhatWasFoundBeforeTheEnd) {
  folder_.make_folder("a");
  folder_.make_file("a/x");
  folder_.make_folder("b");
  ASSERT_EQ(chmod(folder_.path().c_str(), 0755), 0);
  ASSERT_EQ(chmod((folder_ / "b").c_str(), 0), 0);
  const std::string report = in_child([&] {
    if (!become_unprivileged()) return std::string("still privileged");
    const Found open = find(folder_ / "*/*");
    const Found strict = find(folder_ / "*/*", PATHGLOB_ERR);
    return std::to_string(open.result) + ":" + std::to_string(open.paths.size()) + " " + std::to_string(strict.result) +
           ":" + (strict.paths.size() <= 1 ? "some" : "too many");
  });
  ASSERT_EQ(chmod((folder_ / "b").c_str(), 0755), 0);
  EXPECT_EQ(report, "0:1 -2:some");
}

TEST_F(PathGlob, TakesNoDescriptorPerLevel) {
  std::string deep;
  std::string pattern;
  for (int level = 0; level < 200; ++level) {
    deep += "d/";
    pattern += "*/";
  }
  folder_.make_folder(deep);
  const std::string report = in_child([&] {
    const rlimit few = {16, 16};
    if (setrlimit(RLIMIT_NOFILE, &few) != 0) return std::string("no limit");
    return std::to_string(find(folder_ / pattern).paths.size());
  });
  EXPECT_EQ(report, "1");
}

TEST_F(PathGlob, IsSilentAndBoundedForPatternsOfFourKilobytes) {
  std::string nested = "/";
  for (int i = 0; i < 2048; ++i) nested += "*/";
  for (const std::string& pattern :
       {std::string(4096, 'a'), std::string(4096, '*') + "no such name", "~" + std::string(4096, 'u'),
        std::string(4096, '['), std::string(4096, '/') + "no such name", "[" + nested}) {
    EXPECT_EQ(stderr_of([&] { EXPECT_EQ(find(pattern).result, -3); }), "");
  }
}

TEST_F(PathGlob, NullArgumentsAreNoCrash) {
  pathglob_t matches;
  EXPECT_EQ(pathglob(nullptr, 0, nullptr, &matches), -3);
  pathglobfree(&matches);
  EXPECT_EQ(pathglob("/", 0, nullptr, nullptr), -1);
  pathglobfree(nullptr);
}

TEST_F(PathGlob, FreeingTwiceIsHarmless) {
  pathglob_t matches;
  ASSERT_EQ(pathglob("/", 0, nullptr, &matches), 0);
  pathglobfree(&matches);
  pathglobfree(&matches);
  EXPECT_EQ(matches.matchCount, 0U);
}

}  // namespace
}  // namespace vexa_test
