#include "runtime/base/glob_pattern.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

namespace {

using vexa::GlobPattern;

struct Match {
  std::string pattern, name;
  bool matches;
};

void expect_all(const std::vector<Match>& cases) {
  for (const Match& c : cases) {
    EXPECT_EQ(GlobPattern(c.pattern).matches(c.name), c.matches) << c.pattern << " and " << c.name;
  }
}

TEST(GlobPattern, TakesOrdinaryCharactersAsThemselves) {
  expect_all({{"a", "a", true},
              {"a", "b", false},
              {"a", "aa", false},
              {"aa", "a", false},
              {"a", "A", false},
              {"", "", true},
              {"", "a", false},
              {"\\*", "\\x", true},
              {"\\*", "*", false},
              {"a{b,c}", "a{b,c}", true},
              {"^]!-", "^]!-", true},
              {"\xC3\xA9", "\xC3\xA9", true}});
}

TEST(GlobPattern, StarMatchesAnyCharactersAndNone) {
  expect_all({{"*", "", true},
              {"*", "a", true},
              {"*", "abc", true},
              {"a*", "a", true},
              {"a*", "abc", true},
              {"a*", "ba", false},
              {"*c", "abc", true},
              {"*c", "abcd", false},
              {"a*c", "ac", true},
              {"a*c", "abcbc", true},
              {"a*b*c", "a1b2b3c", true},
              {"a*b*c", "acb", false},
              {"**", "", true},
              {"a***b", "ab", true},
              {"*a*", "bab", true},
              {"*ab", "aab", true},
              {"*aab*", "aaaab", true}});
}

TEST(GlobPattern, QuestionMarkMatchesExactlyOneByte) {
  expect_all({{"?", "a", true},
              {"?", "", false},
              {"?", "ab", false},
              {"a?c", "abc", true},
              {"?*", "a", true},
              {"*?", "", false},
              {"*??", "a", false},
              {"*??", "ab", true},
              {"?", "\xFF", true},
              {"??", "\xC3\xA9", true}});
}

TEST(GlobPattern, SetMatchesAListedCharacter) {
  expect_all({{"[abc]", "b", true},
              {"[abc]", "d", false},
              {"[abc]", "", false},
              {"[abc]", "ab", false},
              {"[a]", "a", true},
              {"x[ab]y", "xby", true},
              {"[*]", "*", true},
              {"[*]", "a", false},
              {"[?]", "?", true},
              {"[?]", "a", false},
              {"[\\]", "\\", true},
              {"[[]", "[", true},
              {"[\xE0-\xFF]", "\xE9", true},
              {"[\xE0-\xFF]", "a", false}});
}

TEST(GlobPattern, SetMatchesARange) {
  expect_all({{"[b-d]", "a", false},
              {"[b-d]", "b", true},
              {"[b-d]", "c", true},
              {"[b-d]", "d", true},
              {"[b-d]", "e", false},
              {"[d-b]", "c", false},
              {"[d-b]", "d", false},
              {"[b-b]", "b", true},
              {"[a-cx-z]", "y", true},
              {"[a-cx-z]", "d", false},
              {"[a-c-e]", "-", true},
              {"[a-c-e]", "d", false},
              {"[a-c-e]", "e", true},
              {"[+--]", ",", true},
              {"[+--]", "-", true},
              {"[--0]", ".", false},  // a name's first dot needs a dot
              {"x[--0]", "x.", true}});
}

TEST(GlobPattern, HyphenAtTheEdgesOfASetIsListed) {
  expect_all({{"[a-]", "-", true},
              {"[a-]", "a", true},
              {"[a-]", "b", false},
              {"[-a]", "-", true},
              {"[-a]", "a", true},
              {"[-]", "-", true},
              {"[!-]", "-", false},
              {"[!-]", "a", true}});
}

TEST(GlobPattern, ClosingBracketRightAfterTheOpeningIsListed) {
  expect_all({{"[]]", "]", true},
              {"[]]", "a", false},
              {"[]a]", "a", true},
              {"[]-_]", "^", true},
              {"[!]]", "]", false},
              {"[!]]", "a", true},
              {"[!]a]", "a", false}});
}

TEST(GlobPattern, ExclamationMarkNegatesASetOnlyAtItsBegin) {
  expect_all({{"[!a]", "a", false},
              {"[!a]", "b", true},
              {"[!a]", "", false},
              {"[!a-c]", "b", false},
              {"[!a-c]", "d", true},
              {"[!!]", "!", false},
              {"[!!]", "a", true},
              {"[a!]", "!", true},
              {"[a!]", "b", false},
              {"[^a]", "^", true},
              {"[^a]", "a", true},
              {"[^a]", "b", false}});
}

TEST(GlobPattern, OpeningBracketWithoutItsClosingIsItself) {
  expect_all({{"[", "[", true},
              {"[", "a", false},
              {"[a", "[a", true},
              {"[]", "[]", true},
              {"[!]", "[!]", true},
              {"[!", "[!", true},
              {"]a[", "]a[", true},
              {"[a*", "[abc", true},
              {"[?", "[x", true},
              {"[a-", "[a-", true},
              {"[a][", "a[", true}});
}

TEST(GlobPattern, DotThatBeginsANameNeedsADot) {
  expect_all({{"*", ".a", false},
              {"?a", ".a", false},
              {"[.]a", ".a", false},
              {"[!b]a", ".a", false},
              {".*", ".a", true},
              {".a", ".a", true},
              {".?", ".a", true},
              {"*.a", ".a", false},
              {"*", ".", false},
              {"*", "..", false},
              {".*", "..", true},
              {"a*", "a.b", true},
              {"a?b", "a.b", true},
              {"a[.]b", "a.b", true},
              {"", ".", false}});
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
  expect_all({{repeated("*", 30) + "b", std::string(200, 'a'), false},
              {repeated("*a", 30) + "b", std::string(200, 'a'), false},
              {repeated("a*", 30) + "b", std::string(200, 'a'), false},
              {repeated("a*", 30), std::string(200, 'a'), true},
              {repeated("*?", 30) + "b", std::string(200, 'a'), false},
              {repeated("*[a-z]", 30) + "b", std::string(200, 'a'), false},
              {repeated("*a", 1000) + "b", std::string(4096, 'a'), false},
              {repeated("*[!b]", 800) + "c", std::string(4096, 'a'), false}});
}

}  // namespace
