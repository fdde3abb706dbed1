#include "device/cgi/metadata_frame.h"

#include <gtest/gtest.h>

#include <climits>
#include <string>
#include <vector>

namespace vexa {
namespace {

using MetadataValues = std::vector<int>;

MetadataValues metadata_of(std::string_view body) {
  SLibDRawMDFrameInfo frame;
  frame.window1 = -11;
  frame.window2 = -12;
  frame.window3 = -13;
  frame.window4 = -14;
  take_metadata(body, frame);
  return {frame.window1, frame.window2, frame.window3, frame.window4};
}

TEST(MetadataFrame, TakesTheValueOfEachWindow) {
  const struct {
    const char* body;
    MetadataValues values;
  } rows[] = {{"Window1=3&Window2=0&Window3=12&Window4=0", {3, 0, 12, 0}},
              {"Window4=4&Window3=3\r\nWindow2=2\nWindow1=1", {1, 2, 3, 4}},
              {"Window2=5", {-11, 5, -13, -14}},
              {"MdWindow2=5", {-11, 5, -13, -14}},
              {"Window1= -7 &Window2=+8x", {-7, 8, -13, -14}},
              {"Window1=2147483648&Window2=-2147483649", {INT_MAX, INT_MIN, -13, -14}},
              {"Window1=x&Window1=5", {-11, -12, -13, -14}},
              {"Window1=5&Window1=6", {5, -12, -13, -14}},
              {"Window1=&Window2", {-11, -12, -13, -14}},
              {"Window5=1&Window0=1&window1=1&Window11=1", {-11, -12, -13, -14}},
              {"", {-11, -12, -13, -14}}};
  for (const auto& row : rows) EXPECT_EQ(metadata_of(row.body), row.values) << row.body;
}

TEST(MetadataFrame, EndsAtAZeroByte) {
  EXPECT_EQ(metadata_of(std::string("Window1=1\0Window2=2", 19)), (MetadataValues{1, -12, -13, -14}));
}

TEST(MetadataFrame, IsReadAtEveryLength) {
  const std::string body = "Window1=1&Window2=22&Window3=333&Window4=4444";
  for (std::size_t length = 0; length <= body.size(); ++length) {
    const auto values = metadata_of(body.substr(0, length));
    EXPECT_EQ(values[0], length < 9 ? -11 : 1) << length;
    EXPECT_EQ(values[3], length < 42 ? -14 : std::stoi(body.substr(41, length - 41))) << length;
  }
}

}  // namespace
}  // namespace vexa
