// SPDX-License-Identifier: Apache-2.0
#include "runtime/base/glob_pattern.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

namespace {

using vexa::GlobPattern;

struct Match {
  std::string pattern;
  std::vector<std::string> matching, others;
};

void expect_all(const std::vector<Match>& cases) {
  for (const Match& c : cases) {
    for (const auto& name : c.matching) EXPECT_TRUE(GlobPattern(c.pattern).matches(name)) << c.pattern << ' ' << name;
    for (const auto& name : c.others) EXPECT_FALSE(GlobPattern(c.pattern).matches(name)) << c.pattern << ' ' << name;
  }
}

TEST(GlobPattern, TakesOrdinaryCharactersAsThemselves) {
  expect_all({{"a", {"a"}, {"b", "aa", "A"}},
              {"aa", {}, {"a"}},
              {"", {""}, {"a"}},
              {"\\*", {"\\x"}, {"*"}},
              {"a{b,c}", {"a{b,c}"}, {}},
              {"^]!-", {"^]!-"}, {}},
              {"\xC3\xA9", {"\xC3\xA9"}, {}}});
}

TEST(GlobPattern, StarMatchesAnyCharactersAndNone) {
  expect_all({{"*", {"", "a", "abc"}, {}},
              {"a*", {"a", "abc"}, {"ba"}},
              {"*c", {"abc"}, {"abcd"}},
              {"a*c", {"ac", "abcbc"}, {}},
              {"a*b*c", {"a1b2b3c"}, {"acb"}},
              {"**", {""}, {}},
              {"a***b", {"ab"}, {}},
              {"*a*", {"bab"}, {}},
              {"*ab", {"aab"}, {}},
              {"*aab*", {"aaaab"}, {}}});
}

TEST(GlobPattern, QuestionMarkMatchesExactlyOneByte) {
  expect_all({{"?", {"a", "\xFF"}, {"", "ab"}},
              {"a?c", {"abc"}, {}},
              {"?*", {"a"}, {}},
              {"*?", {}, {""}},
              {"*??", {"ab"}, {"a"}},
              {"??", {"\xC3\xA9"}, {}}});
}

TEST(GlobPattern, SetMatchesAListedCharacter) {
  expect_all({{"[abc]", {"b"}, {"d", "", "ab"}},
              {"[a]", {"a"}, {}},
              {"x[ab]y", {"xby"}, {}},
              {"[*]", {"*"}, {"a"}},
              {"[?]", {"?"}, {"a"}},
              {"[\\]", {"\\"}, {}},
              {"[[]", {"["}, {}},
              {"[\xE0-\xFF]", {"\xE9"}, {"a"}}});
}

TEST(GlobPattern, SetMatchesARange) {
  expect_all({{"[b-d]", {"b", "c", "d"}, {"a", "e"}},
              {"[d-b]", {}, {"c", "d"}},
              {"[b-b]", {"b"}, {}},
              {"[a-cx-z]", {"y"}, {"d"}},
              {"[a-c-e]", {"-", "e"}, {"d"}},
              {"[+--]", {",", "-"}, {}},
              {"[--0]", {}, {"."}},  // a name's first dot needs a dot
              {"x[--0]", {"x."}, {}}});
}

TEST(GlobPattern, HyphenAtTheEdgesOfASetIsListed) {
  expect_all({{"[a-]", {"-", "a"}, {"b"}}, {"[-a]", {"-", "a"}, {}}, {"[-]", {"-"}, {}}, {"[!-]", {"a"}, {"-"}}});
}

TEST(GlobPattern, ClosingBracketRightAfterTheOpeningIsListed) {
  expect_all(
      {{"[]]", {"]"}, {"a"}}, {"[]a]", {"a"}, {}}, {"[]-_]", {"^"}, {}}, {"[!]]", {"a"}, {"]"}}, {"[!]a]", {}, {"a"}}});
}

TEST(GlobPattern, ExclamationMarkNegatesASetOnlyAtItsBegin) {
  expect_all({{"[!a]", {"b"}, {"a", ""}},
              {"[!a-c]", {"d"}, {"b"}},
              {"[!!]", {"a"}, {"!"}},
              {"[a!]", {"!"}, {"b"}},
              {"[^a]", {"^", "a"}, {"b"}}});
}

TEST(GlobPattern, OpeningBracketWithoutItsClosingIsItself) {
  expect_all({{"[", {"["}, {"a"}},
              {"[a", {"[a"}, {}},
              {"[]", {"[]"}, {}},
              {"[!]", {"[!]"}, {}},
              {"[!", {"[!"}, {}},
              {"]a[", {"]a["}, {}},
              {"[a*", {"[abc"}, {}},
              {"[?", {"[x"}, {}},
              {"[a-", {"[a-"}, {}},
              {"[a][", {"a["}, {}}});
}

TEST(GlobPattern, DotThatBeginsANameNeedsADot) {
  expect_all({{"*", {}, {".a", ".", ".."}},
              {"?a", {}, {".a"}},
              {"[.]a", {}, {".a"}},
              {"[!b]a", {}, {".a"}},
              {".*", {".a", ".."}, {}},
              {".a", {".a"}, {}},
              {".?", {".a"}, {}},
              {"*.a", {}, {".a"}},
              {"a*", {"a.b"}, {}},
              {"a?b", {"a.b"}, {}},
              {"a[.]b", {"a.b"}, {}},
              {"", {}, {"."}}});
}

TEST(GlobPattern, KnowsWhetherItHasMetaCharacters) {
  for (const char* with : {"*", "?", "[a]", "a*", "a?b", "x[!a]", "[]]", "[[]"}) {
    EXPECT_TRUE(GlobPattern(with).has_meta()) << with;
  }
  for (const char* without : {"", "a", "[", "[]", "[!]", "]", "!", "-", "\\", "~", "{a,b}", "[a", "a]"}) {
    EXPECT_FALSE(GlobPattern(without).has_meta()) << without;
  }
}

TEST(GlobPattern, EveryByteMatchesItselfAloneAndInASet) {
  for (int value = 1; value < 256; ++value) {
    const std::string name = std::string("x") + static_cast<char>(value);
    if (std::string("*?[").find(name[1]) == std::string::npos) {
      EXPECT_TRUE(GlobPattern(name).matches(name)) << value;
    }
    EXPECT_EQ(GlobPattern(std::string("x[") + name[1] + "]").matches(name), name[1] != '!') << value;
    EXPECT_TRUE(GlobPattern(std::string("x[\x01-") + static_cast<char>(0xFF) + "]").matches(name)) << value;
  }
}

// Each of these takes an exponential matcher longer than anyone waits.
TEST(GlobPattern, ManyStarsCostNoMoreThanTheTwoLengths) {
  const auto repeated = [](const std::string& text, int times) {
    std::string all;
    for (int i = 0; i < times; ++i) all += text;
    return all;
  };
  expect_all({{repeated("*", 30) + "b", {}, {std::string(200, 'a')}},
              {repeated("*a", 30) + "b", {}, {std::string(200, 'a')}},
              {repeated("a*", 30) + "b", {}, {std::string(200, 'a')}},
              {repeated("a*", 30), {std::string(200, 'a')}, {}},
              {repeated("*?", 30) + "b", {}, {std::string(200, 'a')}},
              {repeated("*[a-z]", 30) + "b", {}, {std::string(200, 'a')}},
              {repeated("*a", 1000) + "b", {}, {std::string(4096, 'a')}},
              {repeated("*[!b]", 800) + "c", {}, {std::string(4096, 'a')}}});
}

}  // namespace
