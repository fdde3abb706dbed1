// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>

#include <string>

#include "tests/media/media_driver.h"

namespace vexa_test {
namespace {

const unsigned char* as_data(const std::string& text) { return reinterpret_cast<const unsigned char*>(text.data()); }

TEST(GetUserDataFromStream, StoresThePositionOfTheFirst256Bytes) {
  MediaDriver driver;
  const std::string data = std::string(240, '\0') + "CamPos: 1,2,3 and what follows";
  EXPECT_TRUE(driver.GetUserDataFromStream(as_data(data), static_cast<unsigned int>(data.size())));
  EXPECT_EQ(driver.position_text(), "CamPos: 1,2,3 an");
}

TEST(GetUserDataFromStream, LeavesTheStoredPositionWhenThereIsNone) {
  MediaDriver driver;
  const std::string first = "CamPos: 7";
  ASSERT_TRUE(driver.GetUserDataFromStream(as_data(first), static_cast<unsigned int>(first.size())));
  const std::string behind = std::string(256, 'x') + "CamPos: 8";
  EXPECT_FALSE(driver.GetUserDataFromStream(as_data(behind), static_cast<unsigned int>(behind.size())));
  EXPECT_FALSE(driver.GetUserDataFromStream(nullptr, 0));
  EXPECT_EQ(driver.position_text(), "CamPos: 7");
}

TEST(StorePosition, SearchesTheWholeData) {
  MediaDriver driver;
  const std::string data = std::string(100000, 'C') + "CamPos: 000100020003aabbcc and what follows";
  EXPECT_TRUE(driver.state().store_position({as_data(data), data.size()}));
  EXPECT_EQ(driver.position_text(), "CamPos: 000100020003aabb");
}

}  // namespace
}  // namespace vexa_test
