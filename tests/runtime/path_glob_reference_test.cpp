// SPDX-License-Identifier: Apache-2.0
// pathglob beside the C library's glob, on a tree of 10,000 names. The rules agree in the C locale for patterns without
// "^", "\" and character classes, and with "/" at the end only once, after a "*"; the names and patterns here keep to
// those.
#include <fcntl.h>
#include <glob.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <random>
#include <set>
#include <string>
#include <vector>

#include "tests/support/temporary_folder.h"
#include "vexa/runtime.h"

namespace {

using Paths = std::vector<std::string>;

constexpr unsigned int kSeed = 20240229;
constexpr int kNames = 10000;
constexpr int kPatterns = 1000;

class Choice {
 public:
  explicit Choice(unsigned int seed) : engine_(seed) {}

  /// 0 to `count` - 1.
  int below(int count) { return static_cast<int>(engine_() % static_cast<unsigned int>(count)); }

  char one_of(const std::string& characters) {
    return characters[static_cast<std::size_t>(below(static_cast<int>(characters.size())))];
  }

 private:
  std::mt19937 engine_;
};

std::string random_name(Choice& choice) {
  std::string name;
  const int length = 1 + choice.below(7);
  for (int i = 0; i < length; ++i) name += choice.one_of("aabbccxyz019.-_![]~AB");
  return name;
}

/// A tree of folders, files and links with `kNames` names in all.
void make_tree(const std::string& root, Choice& choice) {
  Paths folders = {root};
  std::set<std::string> made;
  while (made.size() < kNames) {
    const std::string& folder = folders[static_cast<std::size_t>(choice.below(static_cast<int>(folders.size())))];
    const std::string name = random_name(choice);
    const std::string path = folder + "/" + name;
    if (name == "." || name == ".." || !made.insert(path).second) continue;
    const int kind = choice.below(100);
    if (kind < 3) {
      ASSERT_EQ(mkdir(path.c_str(), 0755), 0) << path;
      folders.push_back(path);
    } else if (kind < 5) {
      ASSERT_EQ(symlink("nowhere", path.c_str()), 0) << path;
    } else {
      const int fd = open(path.c_str(), O_CREAT | O_WRONLY | O_CLOEXEC, 0644);
      ASSERT_GE(fd, 0) << path;
      close(fd);
    }
  }
}

std::string random_set(Choice& choice) {
  std::string set = choice.below(3) == 0 ? "[!" : "[";
  if (choice.below(8) == 0) set += ']';
  const int members = 1 + choice.below(3);
  for (int i = 0; i < members; ++i) {
    set += choice.one_of("abcxyz019.-_!AB");
    if (choice.below(3) != 0) continue;
    set += '-';
    set += choice.one_of("abcxyz9B");
  }
  if (choice.below(10) == 0) set += '-';
  return choice.below(12) == 0 ? set : set + ']';
}

std::string random_component(Choice& choice) {
  std::string component;
  const int elements = 1 + choice.below(5);
  for (int i = 0; i < elements; ++i) {
    switch (choice.below(6)) {
      case 0:
      case 1:
        component += '*';
        break;
      case 2:
        component += '?';
        break;
      case 3:
        component += random_set(choice);
        break;
      default:
        component += choice.one_of("abcxyz019.-_!]~AB");
    }
  }
  return component;
}

std::string random_pattern(Choice& choice) {
  std::string pattern;
  const int components = 1 + choice.below(3);
  for (int i = 0; i < components; ++i) {
    pattern += choice.below(3) == 0 ? "*" : random_component(choice);
    if (i + 1 < components) pattern += choice.below(8) == 0 ? "//" : "/";
  }
  return choice.below(12) == 0 ? pattern + "*/" : pattern;
}

Paths ours(const std::string& pattern) {
  pathglob_t matches;
  const int result = pathglob(pattern.c_str(), 0, nullptr, &matches);
  const Paths found(matches.paths, matches.paths + matches.matchCount);
  EXPECT_EQ(result, found.empty() ? PATHGLOB_NOMATCH : 0);
  pathglobfree(&matches);
  return found;
}

Paths the_librarys(const std::string& pattern) {
  glob_t matches{};
  Paths found;
  if (glob(pattern.c_str(), GLOB_NOESCAPE, nullptr, &matches) == 0) {
    found.assign(matches.gl_pathv, matches.gl_pathv + matches.gl_pathc);
  }
  globfree(&matches);
  return found;
}

TEST(PathGlobBesideGlob, FindsTheSamePathsInTheSameOrder) {
  const vexa_test::TemporaryFolder folder(vexa_test::memory_folder());
  Choice choice(kSeed);
  make_tree(folder.path(), choice);
  std::size_t found = 0;
  for (int i = 0; i < kPatterns; ++i) {
    const std::string pattern = folder / random_pattern(choice);
    const Paths expected = the_librarys(pattern);
    EXPECT_EQ(ours(pattern), expected) << pattern;
    found += expected.empty() ? 0 : 1;
  }
  EXPECT_GT(found, 200U) << "most patterns find nothing, so the comparison tells little";
}

}  // namespace
