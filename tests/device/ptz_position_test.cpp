// Where the camera looks, as the text of its pictures tells; and the records of control.
#include <gtest/gtest.h>

#include <climits>
#include <string>

#include "tests/device/ptz_reach.h"

namespace vexa_test {
namespace {

/// What GetCurrentPosition says, and what it leaves in a record that held other values.
struct PositionSaid {
  int result, pan, tilt, horizontal, vertical;
  bool moving;
  bool operator==(const PositionSaid&) const = default;
};

void PrintTo(const PositionSaid& said, std::ostream* out) {
  *out << said.result << ": " << said.pan << ", " << said.tilt << ", " << said.horizontal << ", " << said.vertical
       << (said.moving ? ", moving" : "");
}

/// 57600 units turn 360 degrees, so one unit is 6.25 thousandths of a degree; viewing angles 58 and 34 at the wide end.
class PtzPosition : public PtzUnsent {
 protected:
  PtzPosition() {
    SLibDFixedPanTiltInfo& camera = driver_.m_FixedPTZControlInfo.panTilt;
    camera.panSpan = 57600;
    camera.panAngleRange = 360;
    camera.tiltSpan = 33600;
    camera.tiltAngleRange = 210;
    camera.horizontalWideAngle = 58;
    camera.verticalWideAngle = 34;
    driver_.m_ZoomRatios = {{1, 0}, {2, 0x1000}, {4, 0x2000}};
  }

  PositionSaid said(const std::string& text, bool moving = false) {
    driver_.tell_position(text);
    SLibDPTZStatus status;
    status.panPosition = status.tiltPosition = status.horizontalAngle = status.verticalAngle = 7;
    status.moving = moving;
    const ELibDReturnCode result = driver_.GetCurrentPosition(status);
    return {result,       status.panPosition, status.tiltPosition, status.horizontalAngle, status.verticalAngle,
            status.moving};
  }
};

constexpr PositionSaid kNothingSaid = {0, 7, 7, 7, 7, false};

TEST_F(PtzPosition, IsToldInThousandthsWithTheAnglesOfItsZoom) {
  EXPECT_EQ(said("CamPos: 111006400C81000"), (PositionSaid{1, 625, 1250, 290000, 170000, false}));
}

TEST_F(PtzPosition, CountsInSignedSixteenBits) {
  EXPECT_EQ(said("CamPos: 111FF9CFF380000"), (PositionSaid{1, -625, -1250, 580000, 340000, false}));
  EXPECT_EQ(said("CamPos: 1118000"
                 "7FFF"
                 "2000"),
            (PositionSaid{1, -204800, 204793, 145000, 85000, false}));
}

TEST_F(PtzPosition, IsZeroWhereItsFlagIsNotOne) {
  EXPECT_EQ(said("CamPos: 011006400C81000"), (PositionSaid{1, 0, 1250, 290000, 170000, false}));
  EXPECT_EQ(said("CamPos: 101006400C81000"), (PositionSaid{1, 625, 0, 290000, 170000, false}));
  EXPECT_EQ(said("CamPos: 110006400C81000"), (PositionSaid{1, 625, 1250, 580000, 340000, false}));
  EXPECT_EQ(said("CamPos: xX2006400C81000"), (PositionSaid{1, 0, 0, 580000, 340000, false}));
}

TEST_F(PtzPosition, MovesWhileAnMStandsBehindIt) {
  EXPECT_TRUE(said("CamPos: 111006400C81000M").moving);
  EXPECT_FALSE(said("CamPos: 111006400C81000m").moving);
  EXPECT_FALSE(said("CamPos: 111006400C81000 ").moving);
  EXPECT_FALSE(said("CamPos: 111006400C81000").moving) << "23 characters have no room for it";
}

TEST_F(PtzPosition, NeverClearsTheMovingFlag) {
  EXPECT_TRUE(said("CamPos: 111006400C81000", true).moving);
  EXPECT_TRUE(said("CamPos: 111006400C81000S", true).moving);
}

TEST_F(PtzPosition, IsNegatedInAPictureTurnedUpsideDown) {
  driver_.m_CameraInfo.rotation = 180;
  EXPECT_EQ(said("CamPos: 111006400C81000"), (PositionSaid{1, -625, -1250, 290000, 170000, false}));
  for (const int rotation : {0, -180, 90, 179, 181, 360}) {
    driver_.m_CameraInfo.rotation = rotation;
    EXPECT_EQ(said("CamPos: 111006400C81000"), (PositionSaid{1, 625, 1250, 290000, 170000, false})) << rotation;
  }
}

TEST_F(PtzPosition, CountsTiltFromItsOffsetOnTheSideOfThePicture) {
  driver_.m_FixedPTZControlInfo.panTilt.tiltOffset = 100;
  EXPECT_EQ(said("CamPos: 111000000C80000").tilt, 625);
  driver_.m_CameraInfo.rotation = 180;
  EXPECT_EQ(said("CamPos: 111000000C80000").tilt, -1875);
}

TEST_F(PtzPosition, BeyondAnIntStaysAtItsLimitOnBothSidesOfThePicture) {
  SLibDFixedPanTiltInfo& camera = driver_.m_FixedPTZControlInfo.panTilt;
  camera.panSpan = camera.tiltSpan = 1;
  camera.panAngleRange = camera.tiltAngleRange = INT_MAX;
  const std::string lowest = "CamPos: 111800080000000";
  EXPECT_EQ(said(lowest), (PositionSaid{1, -INT_MAX, -INT_MAX, 580000, 340000, false}));
  driver_.m_CameraInfo.rotation = 180;
  EXPECT_EQ(said(lowest), (PositionSaid{1, INT_MAX, INT_MAX, 580000, 340000, false}));
}

TEST_F(PtzPosition, StaysInTheCamerasUnitsWithoutASpan) {
  driver_.m_FixedPTZControlInfo.panTilt.panSpan = 0;
  driver_.m_FixedPTZControlInfo.panTilt.tiltSpan = 0;
  driver_.m_FixedPTZControlInfo.panTilt.tiltOffset = 50;
  EXPECT_EQ(said("CamPos: 111FF9C00C80000"), (PositionSaid{1, -100, 200, 580000, 340000, false}));
}

TEST_F(PtzPosition, IsReadAsScanfReadsIt) {
  const PositionSaid usual{1, 625, 1250, 290000, 170000, false};
  EXPECT_EQ(said("CamPos: 111  64  C8 1000"), usual) << "blanks in front of numbers are passed over";
  EXPECT_EQ(said("CamPos: 111 0064 00c8 1000"), usual) << "and pieces may stand apart";
  EXPECT_EQ(said("CamPos:   111 64 C8 1000   "), usual) << "flags too";
  EXPECT_EQ(said("CamPos: 1110x64"
                 "0XC8"
                 "1000"),
            usual)
      << "a hexadecimal mark is part of a number";
  EXPECT_EQ(said("CamPos: 111-064+0C81000"), (PositionSaid{1, -625, 1250, 290000, 170000, false}));
  EXPECT_EQ(said("CamPos: 1 0064 00C8 1000"), (PositionSaid{1, 625, 0, 580000, 340000, false})) << "one flag alone";
}

TEST_F(PtzPosition, IsUnknownWithoutAWellFormedText) {
  const std::string whole = "CamPos: 111006400C81000";
  for (std::size_t length = 0; length < whole.size(); ++length) {
    EXPECT_EQ(said(whole.substr(0, length)), kNothingSaid) << length;
  }
  for (const char* text :
       {"campos: 111006400C81000", " CamPos: 111006400C81000", "CamPos:1111006400C81000", "CamPos: 111006400C8xyz0",
        "CamPos: 111g06400C81000", "CamPos: 1110064zzzzzzzz", "CamPos:                ", "xxxxxxxxxxxxxxxxxxxxxxxM"}) {
    EXPECT_EQ(said(text), kNothingSaid) << text;
  }
  EXPECT_EQ(said(std::string("CamPos: 11100\0"
                             "6400C81000",
                             24)),
            kNothingSaid)
      << "a NUL ends the text";
}

TEST_F(PtzPosition, OfABadTextDoesNotEvenMove) { EXPECT_FALSE(said("CamPos: 111006400C8zzzzM").moving); }

TEST_F(PtzPosition, IsUnknownWithoutViewingAnglesButMovesAllTheSame) {
  const auto expect_unknown = [this](const char* why) {
    EXPECT_EQ(said("CamPos: 111006400C80800M"), (PositionSaid{0, 7, 7, 7, 7, true})) << why;
  };
  driver_.m_ZoomRatios.clear();
  expect_unknown("no table");
  driver_.m_ZoomRatios = {{0, 0}};
  expect_unknown("a ratio of 0");
  driver_.m_ZoomRatios = {{1, 0}, {0, 0x1000}};
  expect_unknown("a neighbour of 0");
  driver_.m_ZoomRatios = {{1, 0}, {2, 0x1000}};
  driver_.m_FixedPTZControlInfo.panTilt.horizontalWideAngle = 0;
  expect_unknown("a horizontal angle of 0");
  driver_.m_FixedPTZControlInfo.panTilt.horizontalWideAngle = 58;
  driver_.m_FixedPTZControlInfo.panTilt.verticalWideAngle = 0;
  expect_unknown("a vertical angle of 0");
}

TEST_F(PtzPosition, TakesEveryByteInEveryPlace) {
  const std::string whole = "CamPos: 111006400C81000M";
  for (std::size_t place = 0; place < whole.size(); ++place) {
    for (int byte = 0; byte < 256; ++byte) {
      std::string text = whole;
      text[place] = static_cast<char>(byte);
      const PositionSaid result = said(text);
      EXPECT_TRUE(result.result == 1 || (result.result == 0 && result.pan == 7 && result.tilt == 7)) << text;
    }
  }
}

TEST_F(PtzPosition, LeavesTheAnglesOfACallerWhenItHasNone) {
  int horizontal = 5;
  int vertical = 6;
  driver_.m_ZoomRatios.clear();
  EXPECT_FALSE(driver_.GetViewingAngles(0, horizontal, vertical));
  EXPECT_EQ(horizontal, 5);
  EXPECT_EQ(vertical, 6);
}

TEST_F(PtzUnsent, BecauseTheControlRecordIsTheDriversOwn) {
  SLibDPTZControlInfo stored;
  stored.reserved1 = 1;
  stored.reserved2 = "two";
  stored.reserved3 = 3;
  stored.reserved4 = stored.reserved5 = true;
  stored.brightMode = "Full auto";
  stored.reserved7 = 7;
  stored.reserved8 = "eight";
  stored.reserved9 = 9;
  stored.reserved10 = "ten";
  stored.reserved11 = 11;
  stored.reserved12 = "twelve";
  stored.reserved13 = 13;
  EXPECT_EQ(driver_.SetPTZControlInfo(stored), LIBD_OK);
  stored.reserved2 = "the driver keeps its own";
  SLibDPTZControlInfo read;
  EXPECT_EQ(driver_.GetPTZControlInfo(read), LIBD_OK);
  EXPECT_EQ(read.reserved1, 1);
  EXPECT_EQ(read.reserved2, "two");
  EXPECT_EQ(read.reserved3, 3);
  EXPECT_TRUE(read.reserved4 && read.reserved5);
  EXPECT_EQ(read.brightMode, "Full auto");
  EXPECT_EQ(read.reserved7, 7);
  EXPECT_EQ(read.reserved8, "eight");
  EXPECT_EQ(read.reserved9, 9);
  EXPECT_EQ(read.reserved10, "ten");
  EXPECT_EQ(read.reserved11, 11);
  EXPECT_EQ(read.reserved12, "twelve");
  EXPECT_EQ(read.reserved13, 13);
}

TEST_F(PtzUnsent, BecauseTheFixedRecordIsTheModels) {
  driver_.m_FixedPTZControlInfo.presetCount = 16;
  driver_.m_FixedPTZControlInfo.zoomSteps = {{1, 0}, {2, 5}};
  SLibDFixedPTZControlInfo info;
  EXPECT_EQ(driver_.GetFixedPTZControlInfo(info), LIBD_NOT_SUPPORTED);
  EXPECT_EQ(info.presetCount, 0);
  driver_.m_FixedPTZControlInfoAvailable = true;
  EXPECT_EQ(driver_.GetFixedPTZControlInfo(info), LIBD_OK);
  EXPECT_EQ(info.presetCount, 16);
  ASSERT_EQ(info.zoomSteps.size(), 2U);
  EXPECT_EQ(info.zoomSteps[1].position, 5);
}

}  // namespace
}  // namespace vexa_test
