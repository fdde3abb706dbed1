// Motion on the wire: both dialects over grids of arguments, compared with a model of its own.
#include <gtest/gtest.h>

#include <algorithm>
#include <climits>
#include <cstdlib>
#include <string>
#include <vector>

#include "device/cgi/ptz_text.h"
#include "tests/device/ptz_reach.h"

namespace vexa_test {
namespace {

/// a * b / divisor without its fraction.
long long model_part(long long a, long long b, unsigned long long divisor) {
  const auto magnitude = [](long long value) {
    return value < 0 ? 0ULL - static_cast<unsigned long long>(value) : static_cast<unsigned long long>(value);
  };
  const auto whole = static_cast<long long>(magnitude(a) * magnitude(b) / divisor);
  return (a < 0) != (b < 0) ? -whole : whole;
}

long long model_bounded(long long value, long long least, long long most) {
  if (value < least) value = least;
  return value > most ? most : value;
}

/// The digits of a value of 32 bits, at least four.
std::string model_hex(long long value) {
  const long long unsigned_value = value < 0 ? value + (1LL << 32) : value;
  std::string digits;
  for (long long rest = unsigned_value; rest > 0; rest /= 16) {
    digits.insert(digits.begin(), "0123456789ABCDEF"[rest % 16]);
  }
  return std::string(digits.size() < 4 ? 4 - digits.size() : 0, '0') + digits;
}

/// The low 16 bits: four digits, or eight that begin with FFFF when the highest bit is set.
std::string model_hex_of_16_bits(long long value) {
  const long long low = ((value % 65536) + 65536) % 65536;
  return low < 32768 ? model_hex(low) : "FFFF" + model_hex(low);
}

struct CameraUnits {
  const char* name;
  int pan_speed, tilt_speed;
  int pan_span, pan_origin, tilt_span, tilt_origin;
  int zoom_speed[2], zoom_position[2];
  int focus_speed[2], focus_position[2];
};

constexpr CameraUnits kCameras[] = {
    {"usual", 24, 24, 57600, -28800, 33600, -2400, {1, 8}, {0, 16384}, {1, 8}, {4096, 61440}},
    {"uneven", 18, 7, 33333, 5, -20001, 14401, {0, 7}, {100, 31424}, {2, 3}, {1, 70000}},
    {"wide", 10000, 40000, 400000, 30000, 2147483647, -2147483647, {-5, 32767}, {-8, -2}, {-9, 0}, {-70000, 5}},
    {"reversed", 1, -3, -57600, 28800, 0, 32767, {8, 1}, {16384, 0}, {8, 1}, {61440, 4096}},
    {"none", 0, 0, 0, 0, 0, 0, {0, 0}, {0, 0}, {0, 0}, {0, 0}}};

void fit(PtzDriver& driver, const CameraUnits& camera) {
  SLibDFixedPTZControlInfo& info = driver.m_FixedPTZControlInfo;
  info.panTilt.panMaxSpeed = camera.pan_speed;
  info.panTilt.tiltMaxSpeed = camera.tilt_speed;
  info.panTilt.panSpan = camera.pan_span;
  info.panTilt.panOrigin = camera.pan_origin;
  info.panTilt.tiltSpan = camera.tilt_span;
  info.panTilt.tiltOrigin = camera.tilt_origin;
  info.zoom.minSpeed = camera.zoom_speed[0];
  info.zoom.maxSpeed = camera.zoom_speed[1];
  info.zoom.minPosition = camera.zoom_position[0];
  info.zoom.maxPosition = camera.zoom_position[1];
  info.focus.minSpeed = camera.focus_speed[0];
  info.focus.maxSpeed = camera.focus_speed[1];
  info.focus.minPosition = camera.focus_position[0];
  info.focus.maxPosition = camera.focus_position[1];
}

constexpr int kSpeeds[] = {-10000, -9999, -5000, -1429, -417, -416, -101, -100, -99,  -50,  -1,   0,
                           1,      50,    99,    100,   101,  250,  416,  417,  5000, 9999, 10000};
constexpr int kPositions[] = {0, 1, 2, 15, 16, 99, 100, 2499, 2500, 4999, 5000, 5001, 7777, 9998, 9999, 10000};
TEST(MoveSpeed, HasASignThatCanBeTurnedUnderAnyLargestSpeed) {
  EXPECT_EQ(vexa::move_speed(10000, INT_MIN), -INT_MAX);
  EXPECT_EQ(vexa::move_speed(-10000, INT_MIN), -INT_MAX);
  EXPECT_EQ(vexa::move_speed(10000, INT_MAX), INT_MAX);
}

constexpr int kNoSpeeds[] = {-10001, 10001, INT_MIN, INT_MAX};
constexpr int kNoPositions[] = {-1, 10001, INT_MIN, INT_MAX};

class Motion : public testing::TestWithParam<CameraUnits> {
 protected:
  void expect(const std::vector<SentRow>& rows, bool continuous = false) {
    expect_sent(rows, [continuous](PtzDriver& driver) {
      fit(driver, GetParam());
      driver.m_ContinuousPTZ = continuous;
    });
  }
};

INSTANTIATE_TEST_SUITE_P(Cameras, Motion, testing::ValuesIn(kCameras),
                         [](const auto& param) { return std::string(param.param.name); });

std::string model_move(int pan, int tilt, const CameraUnits& camera) {
  long long pan_speed = model_part(std::abs(pan), camera.pan_speed, 10000);
  long long tilt_speed = model_part(std::abs(tilt), camera.tilt_speed, 10000);
  const long long most = std::max(std::llabs(pan_speed), std::llabs(tilt_speed));
  if (pan < 0) pan_speed = -pan_speed;
  if (tilt < 0) tilt_speed = -tilt_speed;
  if (most == 0) return "Move=stop,motor";
  const std::string rise = tilt_speed > 0 ? "up" : tilt_speed < 0 ? "down" : "";
  const std::string side = pan_speed > 0 ? "right" : pan_speed < 0 ? "left" : "";
  const std::string direction = rise.empty() || side.empty() ? rise + side : rise + "-" + side;
  return "Move=" + direction + "," + std::to_string(most);
}

std::vector<SentRow> pan_tilt_rows(const std::function<std::string(int, int)>& model) {
  std::vector<SentRow> rows;
  for (const int pan : kSpeeds) {
    for (const int tilt : kSpeeds) {
      rows.push_back(
          {[pan, tilt](PtzDriver& d) { return d.PanTilt(pan, tilt); }, "/command/ptzf.cgi?" + model(pan, tilt)});
    }
  }
  return rows;
}

TEST_P(Motion, SendsDirectionAndLargerSpeedInTheMoveDialect) {
  expect(pan_tilt_rows([](int pan, int tilt) { return model_move(pan, tilt, GetParam()); }));
}

TEST_P(Motion, SendsSignedHundredthsInTheContinuousDialect) {
  expect(pan_tilt_rows([](int pan, int tilt) {
           return "ContinuousPanTiltZoom=" + std::to_string(model_part(pan, 1, 100)) + "," +
                  std::to_string(model_part(tilt, 1, 100)) + ",";
         }),
         true);
}

TEST_P(Motion, SendsNoSpeedWhereTheCameraTakesNone) {
  const auto rows = pan_tilt_rows([](int pan, int tilt) {
    const std::string moved = model_move(pan, tilt, GetParam());
    return moved == "Move=stop,motor" ? moved : moved.substr(0, moved.rfind(',')) + ",0";
  });
  expect_sent(rows, [](PtzDriver& driver) {
    fit(driver, GetParam());
    driver.m_FixedPTZControlInfo.noMoveSpeed = true;
  });
}

TEST_P(Motion, SendsAbsolutePositionsAsSixteenBitsAndTheSmallerOfTheLargestSpeeds) {
  const CameraUnits& camera = GetParam();
  std::vector<SentRow> rows;
  for (const int x : kPositions) {
    for (const int y : kPositions) {
      const long long pan = model_part(x, camera.pan_span, 20000) + camera.pan_origin;
      const long long tilt = model_part(y, camera.tilt_span, 20000) + camera.tilt_origin;
      rows.push_back({[x, y](PtzDriver& d) { return d.PanTiltAbsolute(x, y); },
                      "/command/ptzf.cgi?AbsolutePanTilt=" + model_hex_of_16_bits(pan) + "," +
                          model_hex_of_16_bits(tilt) + "," +
                          std::to_string(std::min(camera.pan_speed, camera.tilt_speed))});
    }
  }
  expect(rows);
  expect(rows, true);
}

struct PictureSize {
  int width, height;
};
constexpr PictureSize kSizes[] = {{640, 480}, {1, 1}, {2, 3}, {1920, 1080}, {INT_MAX, INT_MAX}};

SLibDResolutionInfo picture_of(const PictureSize& size) {
  SLibDResolutionInfo picture;
  picture.width = size.width;
  picture.height = size.height;
  return picture;
}

std::string model_offset(int coordinate, int size) {
  return std::to_string(model_bounded(model_part(coordinate, size, 10000), 0, size - 1LL) - size / 2);
}

TEST_P(Motion, CentresThePictureOnAPoint) {
  std::vector<SentRow> rows;
  for (const PictureSize& size : kSizes) {
    for (const int x : kPositions) {
      for (const int y : {0, 4999, 5000, 10000}) {
        rows.push_back({[x, y, size](PtzDriver& d) { return d.PanTiltDirect(x, y, picture_of(size)); },
                        "/command/ptzf.cgi?AreaZoom=" + model_offset(x, size.width) + "," +
                            model_offset(y, size.height) + ",0,0,image1"});
      }
    }
  }
  expect(rows);
}

TEST_P(Motion, SendsAnAreaByItsCentre) {
  std::vector<SentRow> rows;
  for (const PictureSize& size : kSizes) {
    for (const int x : {0, 1, 5000, 9999, 10000}) {
      for (const int width : kPositions) {
        const int y = 10000 - x;
        const int height = 10000 - width;
        rows.push_back(
            {[x, y, width, height, size](PtzDriver& d) { return d.ZoomArea(x, y, width, height, picture_of(size)); },
             "/command/ptzf.cgi?AreaZoom=" + model_offset(x, size.width) + "," + model_offset(y, size.height) + "," +
                 std::to_string(model_part(width, size.width, 10000)) + "," +
                 std::to_string(model_part(height, size.height, 10000)) + ",image1"});
      }
    }
  }
  expect(rows);
}

std::string model_lens_speed(int speed, const int (&range)[2]) {
  return std::to_string(model_bounded(
      range[0] + model_part(std::abs(speed), static_cast<long long>(range[1]) - range[0], 10000), range[0], range[1]));
}

std::string model_lens_position(int position, const int (&range)[2]) {
  return model_hex(model_bounded(range[0] + model_part(position, static_cast<long long>(range[1]) - range[0], 10000),
                                 range[0], range[1]));
}

TEST_P(Motion, ZoomsByWordAndSpeedInTheMoveDialect) {
  std::vector<SentRow> rows;
  for (const int speed : kSpeeds) {
    const std::string word = speed > 0 ? "tele" : "wide";
    rows.push_back({[speed](PtzDriver& d) { return d.Zoom(speed); },
                    speed == 0
                        ? "/command/ptzf.cgi?Move=stop,zoom"
                        : "/command/ptzf.cgi?Move=" + word + "," + model_lens_speed(speed, GetParam().zoom_speed)});
  }
  expect(rows);
}

TEST_P(Motion, ZoomsBySignedHundredthsInTheContinuousDialect) {
  std::vector<SentRow> rows;
  for (const int speed : kSpeeds) {
    rows.push_back({[speed](PtzDriver& d) { return d.Zoom(speed); },
                    "/command/ptzf.cgi?ContinuousPanTiltZoom=,," + std::to_string(model_part(speed, 1, 100))});
  }
  expect(rows, true);
}

TEST_P(Motion, FocusesByWordAndSpeedInBothDialects) {
  std::vector<SentRow> rows;
  for (const int speed : kSpeeds) {
    const std::string word = speed > 0 ? "near" : "far";
    rows.push_back({[speed](PtzDriver& d) { return d.Focus(speed); },
                    speed == 0
                        ? "/command/ptzf.cgi?Move=stop,focus"
                        : "/command/ptzf.cgi?Move=" + word + "," + model_lens_speed(speed, GetParam().focus_speed)});
  }
  expect(rows);
  expect(rows, true);
}

TEST_P(Motion, SendsLensPositionsWithoutCuttingThem) {
  std::vector<SentRow> rows;
  for (const int position : kPositions) {
    rows.push_back({[position](PtzDriver& d) { return d.ZoomAbsolute(position); },
                    "/command/ptzf.cgi?AbsoluteZoom=" + model_lens_position(position, GetParam().zoom_position)});
    rows.push_back({[position](PtzDriver& d) { return d.FocusAbsolute(position); },
                    "/command/ptzf.cgi?AbsoluteFocus=" + model_lens_position(position, GetParam().focus_position)});
  }
  expect(rows);
}

TEST(ZoomRelative, SendsItsShareOf4096AsSixteenBits) {
  std::vector<SentRow> rows;
  for (int step = -100; step <= 100; ++step) {
    rows.push_back({[step](PtzDriver& d) { return d.ZoomRelative(step); },
                    "/command/ptzf.cgi?RelativeZoom=" + model_hex_of_16_bits(model_part(step, 4096, 100))});
  }
  expect_sent(rows, [](PtzDriver&) {});
}

TEST(PtzRequests, AreAsWrittenDown) {
  using D = PtzDriver&;
  const SLibDResolutionInfo vga = picture_of({640, 480});
  const auto usual = [](bool continuous) {
    return [continuous](D driver) {
      fit(driver, kCameras[0]);
      driver.m_ContinuousPTZ = continuous;
    };
  };
  const auto ptzf = [](const std::string& rest) { return "/command/ptzf.cgi?" + rest; };
  expect_sent({{[](D d) { return d.PanTilt(10000, 0); }, ptzf("Move=right,24")},
               {[](D d) { return d.PanTilt(-5000, 5000); }, ptzf("Move=up-left,12")},
               {[](D d) { return d.PanTilt(100, 0); }, ptzf("Move=stop,motor")},
               {[](D d) { return d.PanTiltAbsolute(0, 0); }, ptzf("AbsolutePanTilt=FFFF8F80,FFFFF6A0,24")},
               {[](D d) { return d.PanTiltAbsolute(10000, 10000); }, ptzf("AbsolutePanTilt=0000,3840,24")},
               {[](D d) { return d.ZoomRelative(100); }, ptzf("RelativeZoom=1000")},
               {[](D d) { return d.ZoomRelative(50); }, ptzf("RelativeZoom=0800")},
               {[](D d) { return d.ZoomRelative(-100); }, ptzf("RelativeZoom=FFFFF000")},
               {[&](D d) { return d.PanTiltDirect(10000, 10000, vga); }, ptzf("AreaZoom=319,239,0,0,image1")},
               {[&](D d) { return d.PanTiltDirect(0, 5000, vga); }, ptzf("AreaZoom=-320,0,0,0,image1")},
               {[](D d) { return d.SetFocusMode(true); }, "/command/camera.cgi?FocusMode=auto"},
               {[](D d) { return d.SetFocusMode(false); }, "/command/camera.cgi?FocusMode=manual"}},
              usual(false));
  expect_sent({{[](D d) { return d.PanTilt(-5000, 250); }, ptzf("ContinuousPanTiltZoom=-50,2,")},
               {[](D d) { return d.PanTilt(50, -99); }, ptzf("ContinuousPanTiltZoom=0,0,")},
               {[](D d) { return d.Zoom(10000); }, ptzf("ContinuousPanTiltZoom=,,100")},
               {[](D d) { return d.Zoom(-1); }, ptzf("ContinuousPanTiltZoom=,,0")},
               {[](D d) { return d.Focus(10000); }, ptzf("Move=near,8")}},
              usual(true));
}

using MotionUnsent = PtzUnsent;

TEST_F(MotionUnsent, BecauseASpeedIsOutOfRange) {
  for (const int speed : kNoSpeeds) {
    for (const bool continuous : {false, true}) {
      driver_.m_ContinuousPTZ = continuous;
      EXPECT_EQ(driver_.PanTilt(speed, 0), LIBD_INVALID_ARGUMENT) << speed;
      EXPECT_EQ(driver_.PanTilt(0, speed), LIBD_INVALID_ARGUMENT) << speed;
      EXPECT_EQ(driver_.Zoom(speed), LIBD_INVALID_ARGUMENT) << speed;
      EXPECT_EQ(driver_.Focus(speed), LIBD_INVALID_ARGUMENT) << speed;
    }
  }
}

TEST_F(MotionUnsent, BecauseAPositionIsOutOfRange) {
  const SLibDResolutionInfo vga = picture_of({640, 480});
  for (const int position : kNoPositions) {
    EXPECT_EQ(driver_.PanTiltAbsolute(position, 0), LIBD_INVALID_ARGUMENT) << position;
    EXPECT_EQ(driver_.PanTiltAbsolute(0, position), LIBD_INVALID_ARGUMENT) << position;
    EXPECT_EQ(driver_.PanTiltDirect(position, 0, vga), LIBD_INVALID_ARGUMENT) << position;
    EXPECT_EQ(driver_.PanTiltDirect(0, position, vga), LIBD_INVALID_ARGUMENT) << position;
    EXPECT_EQ(driver_.ZoomAbsolute(position), LIBD_INVALID_ARGUMENT) << position;
    EXPECT_EQ(driver_.FocusAbsolute(position), LIBD_INVALID_ARGUMENT) << position;
    EXPECT_EQ(driver_.ZoomArea(position, 0, 0, 0, vga), LIBD_INVALID_ARGUMENT) << position;
    EXPECT_EQ(driver_.ZoomArea(0, position, 0, 0, vga), LIBD_INVALID_ARGUMENT) << position;
    EXPECT_EQ(driver_.ZoomArea(0, 0, position, 0, vga), LIBD_INVALID_ARGUMENT) << position;
    EXPECT_EQ(driver_.ZoomArea(0, 0, 0, position, vga), LIBD_INVALID_ARGUMENT) << position;
  }
}

TEST_F(MotionUnsent, BecauseAPictureHasNoSize) {
  for (const PictureSize& size : {PictureSize{0, 480}, {640, 0}, {0, 0}, {-1, 480}, {640, -1}, {INT_MIN, INT_MIN}}) {
    EXPECT_EQ(driver_.PanTiltDirect(1, 1, picture_of(size)), LIBD_INVALID_ARGUMENT) << size.width;
    EXPECT_EQ(driver_.ZoomArea(1, 1, 1, 1, picture_of(size)), LIBD_INVALID_ARGUMENT) << size.width;
  }
}

TEST_F(MotionUnsent, BecauseAZoomStepIsOutOfRange) {
  for (const int step : {-101, 101, INT_MIN, INT_MAX}) EXPECT_EQ(driver_.ZoomRelative(step), LIBD_INVALID_ARGUMENT);
}

TEST_F(MotionUnsent, BecauseADirectionHasNoWord) {
  for (const int direction : {-1, 9, INT_MIN, INT_MAX}) {
    EXPECT_EQ(driver_.SendPTZCommands(1, 1, static_cast<ELibDPanTiltDirection>(direction)), 1) << direction;
  }
}

TEST(PtzRequests, TellTheLatestErrorWhenTheyAreRefused) {
  const SLibDResolutionInfo vga = picture_of({640, 480});
  using D = PtzDriver&;
  const SentRow rows[] = {
      {[](D d) { return d.PanTilt(10000, 0); }, "ptzf.cgi?Move=right,24"},
      {[](D d) { return d.PanTilt(0, 0); }, "ptzf.cgi?Move=stop,motor"},
      {[](D d) { return d.PanTiltAbsolute(10000, 0); }, "ptzf.cgi?AbsolutePanTilt=0000,FFFFF6A0,24"},
      {[&](D d) { return d.PanTiltDirect(5000, 5000, vga); }, "ptzf.cgi?AreaZoom=0,0,0,0,image1"},
      {[](D d) { return d.Zoom(0); }, "ptzf.cgi?Move=stop,zoom"},
      {[](D d) { return d.Zoom(1); }, "ptzf.cgi?Move=tele,1"},
      {[](D d) { return d.ZoomAbsolute(0); }, "ptzf.cgi?AbsoluteZoom=0000"},
      {[](D d) { return d.ZoomRelative(0); }, "ptzf.cgi?RelativeZoom=0000"},
      {[&](D d) { return d.ZoomArea(0, 0, 0, 0, vga); }, "ptzf.cgi?AreaZoom=-320,-240,0,0,image1"},
      {[](D d) { return d.SetFocusMode(true); }, "camera.cgi?FocusMode=auto"},
      {[](D d) { return d.Focus(0); }, "ptzf.cgi?Move=stop,focus"},
      {[](D d) { return d.Focus(-10000); }, "ptzf.cgi?Move=far,8"},
      {[](D d) { return d.FocusAbsolute(0); }, "ptzf.cgi?AbsoluteFocus=1000"}};
  for (const SentRow& row : rows) {
    expect_refusal_told({row.call, "/command/" + row.path}, [](D driver) { fit(driver, kCameras[0]); });
  }
}

}  // namespace
}  // namespace vexa_test
