// SPDX-License-Identifier: Apache-2.0
#include "device/cgi/input_part.h"

#include <gtest/gtest.h>

#include <climits>
#include <string>
#include <vector>

namespace vexa {
namespace {

constexpr MotionReport kOdWindows{false, false};
constexpr MotionReport kMdWindows{false, true};
constexpr MotionReport kFlag{true, false};
constexpr MotionReport kFlagOnBit0{true, true};

struct PartCase {
  const char* part;
  MotionReport motion;
  std::uint32_t present;
  std::uint32_t state;
};

void expect_all(std::initializer_list<PartCase> cases) {
  for (const PartCase& c : cases) {
    const PinMasks bits = parse_input_part(c.part, c.motion);
    EXPECT_EQ(bits.present, c.present) << c.part;
    EXPECT_EQ(bits.state, c.state) << c.part;
  }
}

TEST(InputPart, GivesEverySensorItsBit) {
  expect_all({{"", kOdWindows, 0, 0},
              {"nothing known", kOdWindows, 0, 0},
              {"Sensor1=1", kOdWindows, 0b1, 0b1},
              {"Sensor1=0&Sensor2=1&Sensor3=0", kOdWindows, 0b111, 0b010},
              {"Sensor2=1\r\nSensor1=1\r\n\r\n", kOdWindows, 0b11, 0b11},
              {"--boundary\r\nContent-Length: 9\r\nSensor1=1\r\n\r\n", kOdWindows, 0b1, 0b1},
              {"Sensor32=1", kOdWindows, 0x80000000U, 0x80000000U},
              {"Sensor 3= 1", kOdWindows, 0b100, 0b100}});
}

TEST(InputPart, ShiftsWholeValuesNotBits) {
  expect_all({{"Sensor1=3", kOdWindows, 0b1, 0b11},
              {"Sensor2=-1", kOdWindows, 0b10, 0xfffffffeU},
              {"Sensor1=2147483648", kOdWindows, 0b1, 0x7fffffffU}});
}

TEST(InputPart, LooksForTheNextSensorTenCharactersOn) {
  expect_all({{"Sensor1=1Sensor2=1", kOdWindows, 0b1, 0b1},
              {"Sensor1=1&Sensor2=1", kOdWindows, 0b11, 0b11},
              {"Sensor11=1&Sensor2=1", kOdWindows, 0x402, 0x402},
              {"Sensor1=1&", kOdWindows, 0b1, 0b1}});
}

TEST(InputPart, ASensorNumberOutside1To32SetsNumberAndValueButNoBit) {
  expect_all({{"Sensor0=1&Tampering=0", kOdWindows, 0b10, 0},
              {"Sensor33=1&Tampering=0", kOdWindows, 0, 0},
              {"Sensor-5=1&Tampering=1", kOdWindows, 0, 0},
              {"Sensor0=1&OdWin2=0", kOdWindows, 0b1, 0b1},
              {"Sensor2147483647=1&Tampering=1&Audio=1", kOdWindows, 0, 0},
              {"Sensor-2147483648=1&Tampering=1&Audio=1", kOdWindows, 0, 0}});
}

TEST(InputPart, ASensorsNumberCountsWithoutItsValue) {
  expect_all({{"Sensor2&Tampering=1", kOdWindows, 0b1000, 0b1000},
              {"Sensor2=&Tampering=1", kOdWindows, 0b1000, 0b1000},
              {"Sensor=1&Tampering=1", kOdWindows, 0b10, 0b10}});
}

TEST(InputPart, PutsMotionAfterTheLastSensor) {
  expect_all({{"Sensor1=0&Sensor2=0&VMF=1", kFlag, 0b111, 0b100},
              {"Sensor1=0&Sensor2=0&OdWin1=1", kOdWindows, 0b111, 0b100},
              {"Sensor1=0&Sensor2=0&OdWin1=1&Tampering=1&Audio=1", kOdWindows, 0b11111, 0b11100},
              {"VMF=1", kFlag, 0b1, 0b1}});
}

TEST(InputPart, SharesBit0WithSensor1WhenMotionDetectionIsUsed) {
  expect_all({{"Sensor1=0&Sensor2=0&VMF=1", kFlagOnBit0, 0b11, 0b1},
              {"Sensor1=1&Sensor2=0&VMF=0", kFlagOnBit0, 0b11, 0b1},
              {"Sensor1=0&Sensor2=0&MdWin1=1", kMdWindows, 0b11, 0b1}});
}

TEST(InputPart, TakesOnlyTheKeysOfItsMotionReport) {
  expect_all({{"Sensor1=0&VMF=1", kOdWindows, 0b1, 0},
              {"Sensor1=0&MdWin1=1", kOdWindows, 0b1, 0},
              {"Sensor1=0&OdWin1=1", kMdWindows, 0b1, 0},
              {"Sensor1=0&OdWin1=1", kFlag, 0b1, 0},
              {"Sensor1=0&VMF1", kFlag, 0b1, 0},
              {"Sensor1=0&VMF=x", kFlag, 0b1, 0}});
}

TEST(InputPart, Window1SetsTheValueAndOthersOnlyRaiseIt) {
  expect_all({{"Sensor1=0&OdWin1=1&OdWin2=0", kOdWindows, 0b11, 0b10},
              {"Sensor1=0&OdWin1=0&OdWin2=1", kOdWindows, 0b11, 0b10},
              {"Sensor1=0&OdWin2=1&OdWin1=0", kOdWindows, 0b11, 0b00},
              {"Sensor1=0&OdWin2=0&OdWin3=0&OdWin4=1", kOdWindows, 0b11, 0b10}});
}

TEST(InputPart, ComparesTheOtherWindowsWithTheLastSensorsValue) {
  expect_all(
      {{"Sensor1=1&OdWin2=0", kOdWindows, 0b11, 0b11},
       {"Sensor1=0&OdWin2=0", kOdWindows, 0b11, 0b00},
       {"Sensor1=1&OdWin1=0", kOdWindows, 0b11, 0b01},
       {"Sensor2=-1&MdWin2=x&MdWin3=-4", kMdWindows, 0b11, 0xfffffffeU},  // raised to 0 by the one without a value
       {"Sensor2=-1&MdWin2=-2&MdWin3=-4", kMdWindows, 0b11, 0xffffffffU}});
}

TEST(InputPart, NeedsOneWholeWindow) {
  expect_all({{"Sensor1=0&OdWin=1", kOdWindows, 0b1, 0},
              {"Sensor1=0&OdWin1=", kOdWindows, 0b1, 0},
              {"Sensor1=0&OdWinX=1&OdWin2=1", kOdWindows, 0b11, 0b10}});
}

TEST(InputPart, LooksForTheNextWindowNineCharactersOn) {
  expect_all({{"OdWin2=0&OdWin3=1", kOdWindows, 0b1, 0b1}, {"OdWin2=0OdWin3=1", kOdWindows, 0b1, 0b0}});
}

TEST(InputPart, LooksForTamperingAfterTheMotionItems) {
  expect_all({{"Tampering=1&Sensor1=0", kOdWindows, 0b1, 0},
              {"Sensor1=0&Tampering=1&OdWin1=1", kOdWindows, 0b11, 0b10},
              {"Sensor1=0&OdWinTampering=1", kOdWindows, 0b1, 0},
              {"Sensor1=0&OdWin1=1&Tampering=1", kOdWindows, 0b111, 0b110},
              {"Sensor1=0&Tampering=1&VMF=1", kFlag, 0b11, 0b10},
              {"Sensor1=0&VMFxxTampering=1", kFlag, 0b1, 0},
              {"Sensor1=0&VMFxxxTampering=1", kFlag, 0b101, 0b100}});
}

TEST(InputPart, TamperingMovesAudioUpAlsoWithoutAValue) {
  expect_all({{"Sensor1=1&Sensor2=0&Tampering=1&Audio=0", kOdWindows, 0b11011, 0b01001},
              {"Sensor1=0&Sensor2=0&Tampering=x&Audio=1", kOdWindows, 0b10011, 0b10000},
              {"Sensor1=0&Sensor2=0&Audio=1", kOdWindows, 0b1011, 0b1000},
              {"Sensor1=0&Sensor2=0&Audio=", kOdWindows, 0b11, 0}});
}

TEST(InputPart, LooksForAudioTwelveCharactersAfterTampering) {
  expect_all({{"Tampering=1&Audio=1", kOdWindows, 0b110, 0b110},
              {"Tampering=&Audio=1", kOdWindows, 0, 0},
              {"TamperingAudio=1", kOdWindows, 0, 0},
              {"Audio=1&Tampering=1", kOdWindows, 0b10, 0b10}});
}

TEST(InputPart, IsReadAtEveryLength) {
  const std::string part = "Sensor1=1&Sensor2=0&OdWin1=1&MdWin1=1&VMF=1&Tampering=1&Audio=1";
  for (const MotionReport motion : {kOdWindows, kMdWindows, kFlag, kFlagOnBit0}) {
    for (std::size_t length = 0; length <= part.size(); ++length) {
      const PinMasks bits = parse_input_part(part.substr(0, length), motion);
      EXPECT_EQ(bits.state & ~bits.present, 0U) << length;
    }
  }
}

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
