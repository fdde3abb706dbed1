// SPDX-License-Identifier: Apache-2.0
// The numbers of the names, which are compiled into hosts.
#include <gtest/gtest.h>

#include <cstdint>
#include <limits>
#include <type_traits>

#include "vexa/vexa.h"

namespace {

struct EnumeratorRow {
  const char* name;
  std::int64_t actual;
  std::int64_t expected;
};

#define ROW(name, expected) \
  { #name, name, expected }

constexpr EnumeratorRow kEnumerators[] = {
    ROW(LIBD_OK, 1),
    ROW(LIBD_FAILED, 0),
    ROW(LIBD_NOT_SUPPORTED, -100),
    ROW(LIBD_INVALID_ARGUMENT, -101),
    ROW(LIBD_INVALID_MODE, -102),
    ROW(LIBD_STREAM_OPEN_FAILED, -103),
    ROW(LIBD_TIMEOUT, -200),
    ROW(LIBD_UNAUTHORIZED, -201),
    ROW(LIBD_NO_FRAME, -300),
    ROW(LIBD_FRAME_DAMAGED, -301),
    ROW(LIBD_BUFFER_TOO_SMALL, -303),
    ROW(LIBD_VIDEO_PAL, 0),
    ROW(LIBD_VIDEO_NTSC, 1),
    ROW(LIB_VIDEO_OUT_IP, 0),
    ROW(LIB_VIDEO_OUT_PAL, 1),
    ROW(LIB_VIDEO_OUT_NTSC, 2),
    ROW(VIDEO_FRAME_INVALID, -1),
    ROW(VIDEO_FRAME_JPEG, 0),
    ROW(VIDEO_FRAME_MPEG4_KEY, 10),
    ROW(VIDEO_FRAME_MPEG4_DELTA, 11),
    ROW(VIDEO_FRAME_H264_KEY, 20),
    ROW(VIDEO_FRAME_H264_DELTA, 22),
    ROW(LIBD_DAYNIGHT_UNKNOWN, -1),
    ROW(LIBD_DAYNIGHT_AUTO, 10),
    ROW(LIBD_DAYNIGHT_DAY, 20),
    ROW(LIBD_DAYNIGHT_NIGHT, 30),
    ROW(LIBD_XDNR_HIGH, 0),
    ROW(LIBD_XDNR_MIDDLE, 1),
    ROW(LIBD_XDNR_LOW, 2),
    ROW(LIBD_XDNR_OFF, 3),
    ROW(LIBD_VISIBILITY_HIGH, 0),
    ROW(LIBD_VISIBILITY_MIDDLE, 1),
    ROW(LIBD_VISIBILITY_LOW, 2),
    ROW(LIBD_VISIBILITY_OFF, 3),
    ROW(LIBD_VIEWDR_OFF, 0),
    ROW(LIBD_VIEWDR_ON, 1),
    ROW(LIB_IR_OFF, 0),
    ROW(LIB_IR_DAYNIGHT, 1),
    ROW(LIBD_DIRECTION_UP_LEFT, 0),
    ROW(LIBD_DIRECTION_UP, 1),
    ROW(LIBD_DIRECTION_UP_RIGHT, 2),
    ROW(LIBD_DIRECTION_LEFT, 3),
    ROW(LIBD_DIRECTION_STOP, 4),
    ROW(LIBD_DIRECTION_RIGHT, 5),
    ROW(LIBD_DIRECTION_DOWN_LEFT, 6),
    ROW(LIBD_DIRECTION_DOWN, 7),
    ROW(LIBD_DIRECTION_DOWN_RIGHT, 8),
    ROW(PIN_TYPE_SENSOR_INPUT, 0),
    ROW(PIN_TYPE_ALARM_OUTPUT, 1),
    ROW(PIN_TYPE_DETECTION, 2),
    ROW(PIN_TYPE_TAMPERING, 4),
    ROW(PIN_TYPE_AUDIO_DETECTION, 5),
    ROW(LIBD_POSITION_PRESET, 0),
    ROW(LIBD_POSITION_CURRENT, 99),
    ROW(LIBD_TAMPER_LOW, 1),
    ROW(LIBD_TAMPER_MIDDLE, 2),
    ROW(LIBD_TAMPER_HIGH, 3),
    ROW(LIBD_VMD_WINDOW, 0),
    ROW(LIBD_VMD_VMF, 1),
};
#undef ROW

TEST(Enumerators, HaveTheNumbersHostsWereBuiltWith) {
  for (const EnumeratorRow& row : kEnumerators) EXPECT_EQ(row.actual, row.expected) << row.name;
}

template <typename Enumeration>
class Enumerations : public testing::Test {};
using Signed =
    testing::Types<ELibDReturnCode, ELibDVideoStandard, ELibVideoOutMode, ELibDVideoFrameType, ELibDDayNightType,
                   ELibDXdnrType, ELibDVisibilityEnhancerType, ELibDViewDRMode, ELibIRIlluminatorMode,
                   ELibDPanTiltDirection, ELibDPinType, ELibDPositionMode, ELibDTamperLevel, ELibDVMDType>;
TYPED_TEST_SUITE(Enumerations, Signed);

TYPED_TEST(Enumerations, AreSigned32BitNumbersAndHoldAnyOfThem) {
  static_assert(std::is_same_v<std::underlying_type_t<TypeParam>, std::int32_t>);
  static_assert(std::is_convertible_v<TypeParam, std::int32_t>, "unscoped, as hosts use them");
  for (const std::int32_t value :
       {std::numeric_limits<std::int32_t>::min(), -999, 999, std::numeric_limits<std::int32_t>::max()}) {
    EXPECT_EQ(static_cast<TypeParam>(value), value);
  }
}

static_assert(std::is_same_v<std::underlying_type_t<ELibCameraType>, std::uint32_t>, "a set of 32 bits");

}  // namespace
