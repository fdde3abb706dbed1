// SPDX-License-Identifier: Apache-2.0
#include "host/base/printable.h"

#include <gtest/gtest.h>

namespace vexa::host {
namespace {

TEST(Printable, EscapesWhatSteersATerminalAndKeepsTheRest) {
  const struct {
    std::string text;
    const char* shown;
  } cases[] = {{"", ""},
               {"VX-2000 ~", "VX-2000 ~"},
               {"a\r\nb\t", "a\\x0d\\x0ab\\x09"},
               {"\x1b[2J\x7f", "\\x1b[2J\\x7f"},
               {std::string("\0", 1), "\\x00"},
               {"K\xc3\xa4mera", "K\xc3\xa4mera"},
               {"\xc2\x9b"
                "2J",
                "\\xc2\x9b"
                "2J"},
               {"\xc2\xa0", "\xc2\xa0"},
               {"\xc2", "\xc2"}};
  for (const auto& row : cases) {
    SCOPED_TRACE(row.shown);
    EXPECT_EQ(printable(row.text), row.shown);
  }
}

}  // namespace
}  // namespace vexa::host
