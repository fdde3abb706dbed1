// What the reader of exchange files takes and refuses.
#include "tests/support/exchange_file.h"

#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>

#include "tests/support/temporary_folder.h"

namespace vexa_test {
namespace {

class ExchangeFiles : public testing::Test {
 protected:
  ExchangeFile read(const std::string& text) {
    const std::string path = folder_ / "odd.txt";
    std::ofstream(path) << text;
    return read_exchange(path);
  }

  TemporaryFolder folder_;
};

TEST_F(ExchangeFiles, TakeFromAnotherWhatItHasAlready) {
  std::ofstream(folder_ / "model.txt") << "call a\n>>>\n1\n<<< pause=7\nx\n>>>\n2\n<<<\ny\n===\nresult 1\ncode 0\n";
  const ExchangeFile file = read("call b\nafter model 1\n>>> as model\n<<<\nz\n=== as model\ncode 5\n");
  ASSERT_EQ(file.script.size(), 2u);
  EXPECT_EQ(file.script[0].expected + file.script[0].answer, "1x");
  EXPECT_EQ(file.script[0].pause, 7);
  EXPECT_EQ(file.script[1].expected + file.script[1].answer, "2z");
  EXPECT_EQ(file.before, (std::map<std::string, std::string>{{"call", "b"}}));
  EXPECT_EQ(file.results, (std::map<std::string, std::string>{{"result", "1"}, {"code", "5"}}));
  EXPECT_EQ(read(">>>\n0\n<<< as model\n===\nresult 1\n").script[0].answer, "x");
}

TEST_F(ExchangeFiles, WithWhatNobodyUnderstandsAreRefused) {
  std::ofstream(folder_ / "model.txt") << ">>>\n1\n===\nresult 1\n";
  for (const char* text :
       {"cal open\n===\nresult 1\n", "call open\n===\nresutl 1\n", "call open\n===\nresult 1\nresult 2\n",
        "call open\n>>>\n\\q\n===\n", "call open\n>>>\n<<< peace=1\n===\n", "call open\n>>>\n<<< then=leave\n===\n",
        "call open\n", "<<<\n===\n", "after gone 1\n===\n", "after model\n===\n", "after model 2\n===\n",
        "after model 1\n>>> as model\n===\n"}) {
    EXPECT_THROW(read(text), std::runtime_error) << text;
  }
}

}  // namespace
}  // namespace vexa_test
