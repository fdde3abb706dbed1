#include "transport/wire/part_header.h"

#include <gtest/gtest.h>

#include <climits>

namespace vexa {
namespace {

TEST(AnnouncedLength, IsTheNumberAfterItsKey) {
  const struct {
    const char* header;
    std::optional<int> length;
  } cases[] = {{"DataLen: 1234\r\n\r\n", 1234},
               {"--part\r\nContent-Type: image/jpeg\r\nDataLen:1234\r\n\r\n", 1234},
               {"DataLen: \r\n\t 7 bytes", 7},
               {"DataLen: +8", 8},
               {"DataLen: 0", 0},
               {"DataLen: 2147483647", INT_MAX},
               {"DataLen: 99999999999999999999", INT_MAX},
               {"XDataLen: 5", 5},
               {"DataLen: 5 DataLen: 6", 5},
               {"DataLen: x DataLen: 6", std::nullopt},
               {"DataLen: -1", std::nullopt},
               {"DataLen: -99999999999999999999", std::nullopt},
               {"DataLen:", std::nullopt},
               {"DataLen: -", std::nullopt},
               {"DataLen", std::nullopt},
               {"datalen: 5", std::nullopt},
               {"Content-Length: 5", std::nullopt},
               {"", std::nullopt}};
  for (const auto& c : cases) EXPECT_EQ(announced_length(c.header), c.length) << c.header;
}

}  // namespace
}  // namespace vexa
