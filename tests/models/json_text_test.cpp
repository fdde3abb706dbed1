// SPDX-License-Identifier: Apache-2.0
#include "models/json_text.h"

#include <gtest/gtest.h>

#include <string>

namespace vexa::models {
namespace {

JsonProblem problem_of(const std::string& text) {
  const auto parsed = parse_json(text);
  const auto* problem = std::get_if<JsonProblem>(&parsed);
  return problem == nullptr ? JsonProblem{-1, "", "parsed"} : *problem;
}

TEST(JsonText, KeepsValuesInTheirOrder) {
  const auto parsed = parse_json(R"({"b": [1, -2, "x"], "a": true, "n": null, "f": 1.5, "o": {}})");
  const auto& root = std::get<Node>(parsed);
  ASSERT_EQ(root.kind, Node::Kind::kObject);
  ASSERT_EQ(root.members.size(), 5U);
  EXPECT_EQ(root.members[0].key, "b");
  const Node* list = root.find("b");
  ASSERT_EQ(list->items.size(), 3U);
  EXPECT_EQ(list->items[0].number, 1);
  EXPECT_EQ(list->items[1].number, -2);
  EXPECT_EQ(list->items[2].text, "x");
  EXPECT_TRUE(root.find("a")->flag);
  EXPECT_EQ(root.find("n")->kind, Node::Kind::kNull);
  EXPECT_EQ(root.find("f")->kind, Node::Kind::kFraction);
  EXPECT_EQ(root.find("o")->kind, Node::Kind::kObject);
  EXPECT_EQ(root.find("missing"), nullptr);
}

TEST(JsonText, KnowsTheLineOfEveryValue) {
  const auto parsed = parse_json("\n{\n\"a\":\n\n1,\n\"b\": [\n2\n,\n\"t\"\n,\n{\n}\n]\n}\n");
  const auto& root = std::get<Node>(parsed);
  EXPECT_EQ(root.line, 2);
  EXPECT_EQ(root.find("a")->line, 3) << "a member's line is its key's";
  const Node* list = root.find("b");
  EXPECT_EQ(list->line, 6);
  EXPECT_EQ(list->items[0].line, 7) << "the line end behind a number is not its own";
  EXPECT_EQ(list->items[1].line, 9);
  EXPECT_EQ(list->items[2].line, 11);
}

TEST(JsonText, RefusesWhatIsNoJsonAndNamesTheLine) {
  const struct {
    const char* text;
    int line;
  } cases[] = {{"", 1},         {"\n\n", 2},      {"{\n\"a\": 1\n\"b\": 2}", 3},
               {"[1,\n2,]", 2}, {"{}\n{}", 2},    {"{\"a\" 1}", 1},
               {"[\n01]", 2},   {"\"\xff\"", 1},  {"nul", 1},
               {"[1e999]", 1},  {"// remark", 1}, {"{'a': 1}", 1}};
  for (const auto& c : cases) {
    EXPECT_EQ(problem_of(c.text).text, "not JSON: something is missing, too many or misspelt here") << c.text;
    EXPECT_EQ(problem_of(c.text).line, c.line) << c.text;
  }
}

TEST(JsonText, RefusesAKeyThatOccursTwice) {
  const JsonProblem problem = problem_of("{\"a\": 1,\n\"b\": 2,\n\"a\": 3}");
  EXPECT_EQ(problem.key, "a");
  EXPECT_EQ(problem.line, 3);
  EXPECT_EQ(problem.text, "occurs twice");
  EXPECT_EQ(problem_of(R"([{"a": 1}, {"a": 1}])").text, "parsed");
}

TEST(JsonText, RefusesAnIntegerThat64BitsDoNotHold) {
  EXPECT_EQ(problem_of("9223372036854775807").text, "parsed");
  EXPECT_EQ(problem_of("9223372036854775808").text, "too large");
}

TEST(JsonText, RefusesNestingDeeperThan16) {
  EXPECT_EQ(problem_of(std::string(16, '[') + std::string(16, ']')).text, "parsed");
  EXPECT_EQ(problem_of(std::string(17, '[') + std::string(17, ']')).text, "nested too deeply");
  EXPECT_EQ(problem_of(std::string(1000000, '[')).text, "nested too deeply");
}

}  // namespace
}  // namespace vexa::models
