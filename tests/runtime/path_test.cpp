// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>
#include <unistd.h>

#include <filesystem>
#include <string>

#include "tests/support/in_child.h"
#include "tests/support/temporary_folder.h"
#include "vexa/runtime.h"

namespace vexa_test {
namespace {

struct Pieces {
  std::string drive, dir, name, ext;
};

Pieces split(const std::string& path) {
  const std::string room(path.size() + 1, '#');
  Pieces pieces = {room, room, room, room};
  _splitpath(path.c_str(), pieces.drive.data(), pieces.dir.data(), pieces.name.data(), pieces.ext.data());
  return {pieces.drive.c_str(), pieces.dir.c_str(), pieces.name.c_str(), pieces.ext.c_str()};
}

std::string join(const Pieces& pieces) {
  std::string path(4096, '#');
  _makepath(path.data(), pieces.drive.c_str(), pieces.dir.c_str(), pieces.name.c_str(), pieces.ext.c_str());
  return path.c_str();
}

std::string in_folder(const std::string& folder, unsigned long len) {
  return in_child([&] {
    if (chdir(folder.c_str()) != 0) return std::string("chdir failed");
    std::string buffer(64, '#');
    const unsigned long result = GetCurrentDirectory(len, buffer.data());
    return std::to_string(result) + " " + buffer.substr(0, buffer.find('\0')) + buffer.back();
  });
}

TEST(GetCurrentDirectory, ReportsTheRoomItNeedsAndCopiesNothing) {
  const std::string untouched(65, '#');
  EXPECT_EQ(in_folder("/tmp", 4), "5 " + untouched);
  EXPECT_EQ(in_folder("/tmp", 0), "5 " + untouched);
  EXPECT_EQ(in_folder("/", 1), "2 " + untouched);
}

TEST(GetCurrentDirectory, CopiesThePathWhereItFitsWithItsTerminator) {
  EXPECT_EQ(in_folder("/tmp", 5), "4 /tmp#");
  EXPECT_EQ(in_folder("/tmp", 64), "4 /tmp#");
  EXPECT_EQ(in_folder("/", 2), "1 /#");
}

TEST(GetCurrentDirectory, NeedsNoBufferToTellTheRoom) {
  EXPECT_EQ(GetCurrentDirectory(0, nullptr), std::filesystem::current_path().string().size() + 1);
}

TEST(GetCurrentDirectory, GivesAPathLongerThanTheSystemTakes) {
  const TemporaryFolder folder;
  const std::string name(200, 'd');
  const std::string report = in_child([&] {
    if (chdir(folder.path().c_str()) != 0) return std::string("chdir failed");
    for (int depth = 0; depth < 25; ++depth) {
      if (!CreateDirectory(name.c_str(), nullptr) || chdir(name.c_str()) != 0) return std::string("no depth");
    }
    std::string buffer(8192, '#');
    return std::to_string(GetCurrentDirectory(8192, buffer.data())) + " " + buffer.c_str();
  });
  std::string expected = folder.path();
  for (int depth = 0; depth < 25; ++depth) expected += "/" + name;
  EXPECT_EQ(report, std::to_string(expected.size()) + " " + expected);
}

TEST(GetCurrentDirectory, ReportsThatItsFolderIsGone) {
  const TemporaryFolder folder;
  const std::string gone = folder.make_folder("gone");
  const std::string report = in_child([&] {
    if (chdir(gone.c_str()) != 0 || rmdir(gone.c_str()) != 0) return std::string("not gone");
    char buffer[64] = "#";
    unsigned long result = 1;
    const std::string text = stderr_of([&] { result = GetCurrentDirectory(sizeof buffer, buffer); });
    return std::to_string(result) + buffer + text;
  });
  EXPECT_EQ(report, "0#GetCurrentDirectory getcwd: No such file or directory\n");
}

TEST(SplitPath, CutsAPathIntoItsPieces) {
  const struct {
    const char* path;
    Pieces pieces;
  } cases[] = {
      {"c:/a/b.txt", {"c:", "/a/", "b", ".txt"}},
      {"", {"", "", "", ""}},
      {":", {"", "", ":", ""}},
      {"c:", {"c:", "", "", ""}},
      {"::", {"::", "", "", ""}},
      {"c:b", {"c:", "", "b", ""}},
      {"/:/b", {"/:", "/", "b", ""}},
      {"b", {"", "", "b", ""}},
      {"b.txt", {"", "", "b", ".txt"}},
      {"b.", {"", "", "b", "."}},
      {".", {"", "", "", "."}},
      {"..", {"", "", ".", "."}},
      {".hidden", {"", "", "", ".hidden"}},
      {"b.tar.gz", {"", "", "b.tar", ".gz"}},
      {"/", {"", "/", "", ""}},
      {"/b", {"", "/", "b", ""}},
      {"a/", {"", "a/", "", ""}},
      {"a.d/b", {"", "a.d/", "b", ""}},
      {"a.d/", {"", "a.d/", "", ""}},
      {"a//b.c", {"", "a//", "b", ".c"}},
      {"ab:c", {"", "", "ab:c", ""}},
      {"a\\b.c", {"", "", "a\\b", ".c"}},
  };
  for (const auto& c : cases) {
    const Pieces pieces = split(c.path);
    EXPECT_EQ(pieces.drive, c.pieces.drive) << c.path;
    EXPECT_EQ(pieces.dir, c.pieces.dir) << c.path;
    EXPECT_EQ(pieces.name, c.pieces.name) << c.path;
    EXPECT_EQ(pieces.ext, c.pieces.ext) << c.path;
  }
}

TEST(SplitPath, SkipsNullOutputs) {
  for (int wanted = 0; wanted < 4; ++wanted) {
    char output[16] = "";
    _splitpath("c:/a/b.txt", wanted == 0 ? output : nullptr, wanted == 1 ? output : nullptr,
               wanted == 2 ? output : nullptr, wanted == 3 ? output : nullptr);
    const char* const expected[] = {"c:", "/a/", "b", ".txt"};
    EXPECT_STREQ(output, expected[wanted]);
  }
}

TEST(SplitPath, ReadsNullAsTheEmptyPath) {
  char drive[] = "#", dir[] = "#", name[] = "#", ext[] = "#";
  _splitpath(nullptr, drive, dir, name, ext);
  EXPECT_STREQ(drive, "");
  EXPECT_STREQ(dir, "");
  EXPECT_STREQ(name, "");
  EXPECT_STREQ(ext, "");
}

TEST(SplitPath, CopiesPiecesWhateverTheirLength) {
  for (const std::size_t length : {253, 254, 255, 4094, 4095, 4096, 10000}) {
    const std::string dir = "/" + std::string(length, 'd') + "/";
    const std::string name(length, 'n');
    const std::string ext = "." + std::string(length, 'e');
    const Pieces pieces = split(dir + name + ext);
    EXPECT_EQ(pieces.dir, dir) << length;
    EXPECT_EQ(pieces.name, name) << length;
    EXPECT_EQ(pieces.ext, ext) << length;
  }
}

TEST(MakePath, JoinsThePieces) {
  const struct {
    Pieces pieces;
    const char* path;
  } cases[] = {
      {{"c", "/a", "b", "txt"}, "c:/a/b.txt"},
      {{"c:", "/a/", "b", ".txt"}, "c:/a/b.txt"},
      {{"", "", "", ""}, ""},
      {{"c", "", "", ""}, "c:"},
      {{"", "a", "", ""}, "a/"},
      {{"", "/", "", ""}, "/"},
      {{"", "", "b", ""}, "b"},
      {{"", "", "", "txt"}, ".txt"},
      {{"", "", "", "."}, "."},
      {{"", "", "Log1", ".txt"}, "Log1.txt"},
      {{"", "", "Log1", ""}, "Log1"},
      {{"", "a", "b", "..c"}, "a/b..c"},
      {{"", "%s", "%n", "%d"}, "%s/%n.%d"},
  };
  for (const auto& c : cases) EXPECT_EQ(join(c.pieces), c.path);
}

TEST(MakePath, AddsNothingForNullPieces) {
  char path[4096] = "#";
  _makepath(path, nullptr, nullptr, nullptr, nullptr);
  EXPECT_STREQ(path, "");
  _makepath(path, nullptr, nullptr, "b", nullptr);
  EXPECT_STREQ(path, "b");
  _makepath(nullptr, "c", "/a", "b", "txt");
}

TEST(MakePath, JoinsAgainWhatWasSplit) {
  for (const char* path : {"c:/a/b.txt", "Log.txt", "/var/log/Log", "a.d/b", "/", ".hidden", "a//b."}) {
    EXPECT_EQ(join(split(path)), path);
  }
}

TEST(MakePath, StopsAtThePieceThatWouldPass4095Characters) {
  const auto text = [](std::size_t length, char c) { return std::string(length, c); };
  const struct {
    Pieces pieces;
    std::string path;
  } cases[] = {
      {{"", text(4094, 'd'), "", ""}, text(4094, 'd') + "/"},
      {{"", text(4095, 'd'), "n", "e"}, text(4095, 'd')},
      {{"", text(4096, 'd'), "n", "e"}, ""},
      {{"c", text(4093, 'd'), "n", "e"}, "c:" + text(4093, 'd')},
      {{"c", text(4094, 'd'), "n", "e"}, "c:"},
      {{"", "d", text(4093, 'n'), ""}, "d/" + text(4093, 'n')},
      {{"", "d", text(4094, 'n'), "e"}, "d/"},
      {{"", "", text(4093, 'n'), "e"}, text(4093, 'n') + ".e"},
      {{"", "", text(4094, 'n'), "e"}, text(4094, 'n') + "."},
      {{"", "", text(4095, 'n'), "e"}, text(4095, 'n')},
      {{"", "", text(4092, 'n'), ".ee"}, text(4092, 'n') + ".ee"},
      {{"", "", text(4093, 'n'), ".ee"}, text(4093, 'n')},
  };
  for (const auto& c : cases) EXPECT_EQ(join(c.pieces), c.path);
}

}  // namespace
}  // namespace vexa_test
