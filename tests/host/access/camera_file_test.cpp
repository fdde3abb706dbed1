// SPDX-License-Identifier: Apache-2.0
#include "host/access/camera_file.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "tests/support/temporary_folder.h"

namespace vexa::host {
namespace {

using testing::HasSubstr;
using testing::Not;
using vexa_test::TemporaryFolder;

constexpr char kTwo[] = R"({"cameras": [
  {"name": "gate", "address": "192.168.0.100"},
  {"name": "yard 2", "address": "yard:8080", "profile": "LMX-P200", "tileStream": 3,
   "userVariable": "YARD_USER", "passwordVariable": "YARD_PASSWORD"}
]})";

std::string refusal(const std::string& text) {
  const auto file = CameraFile::parse(text, "cameras.json");
  if (file) return "taken";
  EXPECT_EQ(file.error().code, ExitCode::kUsage);
  EXPECT_NE(file.error().advice, "");
  return file.error().text;
}

// One camera with these members.
std::string of_camera(const std::string& members) { return refusal("{\"cameras\": [\n{" + members + "}]}"); }

TEST(CameraFile, HasItsCamerasInOrder) {
  const auto file = CameraFile::parse(kTwo, "cameras.json");
  ASSERT_TRUE(file) << file.error().text;
  ASSERT_EQ(file->cameras().size(), 2U);
  const FileCamera& gate = file->cameras()[0];
  EXPECT_EQ(gate.name, "gate");
  EXPECT_EQ(to_string(gate.address), "192.168.0.100:80");
  EXPECT_EQ(gate.profile, std::nullopt);
  EXPECT_EQ(gate.tile_stream, std::nullopt);
  EXPECT_EQ(gate.line, 2);
  const FileCamera& yard = file->cameras()[1];
  EXPECT_EQ(yard.name, "yard 2");
  EXPECT_EQ(to_string(yard.address), "yard:8080");
  EXPECT_EQ(yard.profile, "LMX-P200");
  EXPECT_EQ(yard.user_variable, "YARD_USER");
  EXPECT_EQ(yard.tile_stream, 3);
  EXPECT_EQ(yard.line, 3);
}

TEST(CameraFile, FindsACameraByItsWholeName) {
  const auto file = CameraFile::parse(kTwo, "cameras.json");
  ASSERT_TRUE(file);
  const auto yard = file->find("yard 2");
  ASSERT_TRUE(yard);
  EXPECT_EQ(yard->address.host, "yard");
  for (const char* const name : {"", "yard", "GATE", "hunter2"}) {
    const auto none = file->find(name);
    ASSERT_FALSE(none) << name;
    EXPECT_EQ(none.error().text, "cameras.json has no camera of that name");
    EXPECT_THAT(none.error().advice, Not(HasSubstr("hunter2")));
  }
}

TEST(CameraFile, IsRefusedWithLineAndKey) {
  EXPECT_EQ(of_camera(R"("address": "a",
 "name": "")"),
            "cameras.json, line 3: \"name\" is not a name");
  const std::pair<const char*, const char*> kCases[] = {
      {R"("name": "a", "address": "b", "tileStream": 0)", "\"tileStream\" is not a number from 1 to 16"},
      {R"("name": "a", "address": "b", "tileStream": 17)", "\"tileStream\" is not a number from 1 to 16"},
      {R"("name": "a", "address": "b", "tileStream": -1)", "\"tileStream\" is not a whole number"},
      {R"("name": "a", "address": "b", "tileStream": 1.5)", "\"tileStream\" is not a whole number"},
      {R"("name": "a", "address": "b", "tileStream": "1")", "\"tileStream\" is not a whole number"},
      {R"("name": "a\u001b", "address": "a")", "\"name\" is not a name"},
      {R"("name": "-a", "address": "a")", "\"name\" is not a name"},
      {R"("name": 5, "address": "a")", "\"name\" is not a text"},
      {R"("name": -5, "address": "a")", "\"name\" is not a text"},
      {R"("name": 1.5, "address": "a")", "\"name\" is not a text"},
      {R"("name": ["a"], "address": "a")", "\"name\" is not a text"},
      {R"("name": {"a": 1}, "address": "a")", "\"name\" is not a text"},
      {R"("name": "a", "name": "b", "address": "a")", "\"name\" is there twice"},
      {R"("name": "a", "address": null)", "\"address\" is not a text"},
      {R"("name": "a", "address": "::1")", "\"address\" cannot be used: IPv6 addresses are not supported"},
      {R"("name": "a", "address": "b:0")",
       "\"address\" cannot be used: the port in the camera's address is not a number from 1 to 65535"},
      {R"("name": "a", "address": "b", "adress": "c")", "\"adress\" is not a key of a camera"},
      {R"("name": "a", "address": "b", "password": "hunter2")", "\"password\" does not belong into this file"},
      {R"("name": "a", "address": "b", "profile": "")", "\"profile\" is empty or holds a NUL character"},
      {R"("name": "a", "address": "b", "profile": true)", "\"profile\" is not a text"},
      {R"("name": "a", "address": "b", "userVariable": "A=B")", "\"userVariable\" is not a variable's name"},
      {R"("name": "a", "address": "b", "userVariable": "A")",
       "a camera with one of \"userVariable\" and \"passwordVariable\""},
      {R"("name": "a", "address": "b", "userVariable": "A", "passwordVariable": "B", "credentials": "c")",
       "a camera with both \"credentials\" and \"userVariable\""},
      {R"("name": "a")", "a camera without \"address\""},
      {R"("address": "a")", "a camera without \"name\""},
      {R"("name": "a", "address": "hunter2)", "is not JSON, after \"address\""},
      {R"("name": "a", "address": hunter2)", "is not JSON, after \"address\""},
  };
  for (const auto& [members, text] : kCases)
    EXPECT_EQ(of_camera(members), std::string("cameras.json, line 2: ") + text);
}

TEST(CameraFile, IsRefusedWhereItIsNotAFileOfCameras) {
  const std::pair<const char*, const char*> kCases[] = {
      {"", "cameras.json, line 1: is not JSON"},
      {"\n\nhunter2", "cameras.json, line 3: is not JSON"},
      {"[]", "cameras.json, line 1: a value stands where it does not belong"},
      {"7", "cameras.json, line 1: a value stands where it does not belong"},
      {"{}", "cameras.json, line 1: the file lists no \"cameras\""},
      {"{\"cameras\": []}", "cameras.json, line 1: the file lists no \"cameras\""},
      {"{\"cameras\": {}}", "cameras.json, line 1: \"cameras\" is not a list"},
      {"{\"cameras\": [[]]}", "cameras.json, line 1: what \"cameras\" lists is not a camera in braces"},
      {"{\"cameras\": [], \"cameras\": []}", "cameras.json, line 1: \"cameras\" is there twice"},
      {"{\n\"camera\": []}", "cameras.json, line 2: \"camera\" is not a key of the file"},
      {"{\"cameras\": [\n{\"name\": \"a\", \"address\": \"b\"},\n{\"name\": \"a\", \"address\": \"c\"}]}",
       "cameras.json, line 3: a second camera with the \"name\" a"},
      {"{\"cameras\": [{\"name\": \"a\", \"address\": \"b\"}]} {", "cameras.json, line 1: is not JSON"},
  };
  for (const auto& [text, refused] : kCases) EXPECT_EQ(refusal(text), refused) << text;
}

TEST(CameraFile, CutAnywhereIsRefused) {
  const std::string whole = kTwo;
  for (std::size_t length = 0; length < whole.size(); ++length) EXPECT_NE(refusal(whole.substr(0, length)), "taken");
}

TEST(CameraFile, ThatCannotBeReadIsRefused) {
  const TemporaryFolder folder;
  const auto none = CameraFile::read(folder / "none.json");
  ASSERT_FALSE(none);
  EXPECT_EQ(none.error().text, "cannot read " + (folder / "none.json") + ": No such file or directory");
}

TEST(CameraFileCredentials, AreInTheFolderOfTheFileOfCameras) {
  const TemporaryFolder folder;
  (void)folder.make_file("gate.cred", "operator:tr0ub4dor\n");
  const auto file = CameraFile::read(
      folder.make_file("cameras.json", R"({"cameras": [{"name": "a", "address": "b", "credentials": "gate.cred"}]})"));
  ASSERT_TRUE(file) << file.error().text;
  const char* const kNone[] = {nullptr};
  const auto loaded = file->credentials_of(file->cameras()[0], {.environment_user = "other"}, kNone);
  ASSERT_TRUE(loaded) << loaded.error().text;
  EXPECT_EQ(loaded->user + "|" + loaded->password, "operator|tr0ub4dor");
}

TEST(CameraFileCredentials, OfTheEnvironmentAreThoseOfTheCamerasVariables) {
  const auto file = CameraFile::parse(kTwo, "cameras.json");
  ASSERT_TRUE(file);
  const CredentialSources otherwise{.environment_user = "all", .environment_password = "other"};
  const char* const environment[] = {"YARD_USER=operator", "YARD_PASSWORD=a=b", nullptr};
  const auto yard = file->credentials_of(file->cameras()[1], otherwise, environment);
  ASSERT_TRUE(yard);
  EXPECT_EQ(yard->user + "|" + yard->password, "operator|a=b");
  const auto gate = file->credentials_of(file->cameras()[0], otherwise, environment);
  ASSERT_TRUE(gate);
  EXPECT_EQ(gate->user + "|" + gate->password, "all|other");
  const auto missing = file->credentials_of(file->cameras()[1], otherwise, environment + 1);
  ASSERT_FALSE(missing);
  EXPECT_EQ(missing.error().text, "cameras.json, line 3, camera yard 2: the environment has no variable YARD_USER");
}

}  // namespace
}  // namespace vexa::host
