#include "virtual_camera/rtp/sender_report.h"

#include <gtest/gtest.h>

namespace vexa::camera {
namespace {

using std::chrono::milliseconds;
using std::chrono::nanoseconds;
using std::chrono::seconds;

constexpr seconds kBegan{1'800'000'000};
constexpr std::uint32_t kNtpSeconds = 1'800'000'000u + 2'208'988'800u;  // modulo 2^32: in the era of 1900

Outgoing first_of(std::uint64_t picture) {
  Outgoing packet;
  packet.header = {0x80, 96, 0, 1, 9, 8, 7, 6, 1, 2, 3, 4};
  packet.record.picture = picture;
  return packet;
}

std::uint32_t word(const SenderReportBytes& bytes, std::size_t place) {
  return static_cast<std::uint32_t>(bytes[place]) << 24U | static_cast<std::uint32_t>(bytes[place + 1]) << 16U |
         static_cast<std::uint32_t>(bytes[place + 2]) << 8U | bytes[place + 3];
}

TEST(SenderReport, NamesTheSourceAndBothTimesOfAPicture) {
  const SenderReportWriter writer({.every = 1}, kBegan);
  const SenderReportBytes bytes = writer.write(first_of(3), milliseconds(1500));
  EXPECT_EQ(word(bytes, 0), 0x80c80006u);
  EXPECT_EQ(word(bytes, 4), 0x01020304u);
  EXPECT_EQ(word(bytes, 8), kNtpSeconds + 1);
  EXPECT_EQ(word(bytes, 12), 0x80000000u);
  EXPECT_EQ(word(bytes, 16), 0x09080706u);
}

TEST(SenderReport, IsDueWithEverySoManyPicturesFromTheFirst) {
  const SenderReportWriter none({}, kBegan);
  const SenderReportWriter some({.every = 5}, kBegan);
  for (std::uint64_t picture = 0; picture < 11; ++picture) {
    EXPECT_FALSE(none.due(picture));
    EXPECT_EQ(some.due(picture), picture % 5 == 0);
  }
}

TEST(SenderReport, ShowsTheClockAsItIsTold) {
  struct Case {
    SenderReports reports;
    std::uint32_t seconds;
  };
  const Case cases[] = {{{.every = 1, .clock = ReportedClock::kFrozen}, kNtpSeconds},
                        {{.every = 1, .clock = ReportedClock::kZero}, 0},
                        {{.every = 1, .ahead = seconds(3600)}, kNtpSeconds + 1000 + 3600},
                        {{.every = 1, .drift = -5000}, kNtpSeconds + 1000 - 5},
                        {{.every = 1, .step_at = 7, .step = seconds(60)}, kNtpSeconds + 1060},
                        {{.every = 1, .step_at = 8, .step = seconds(60)}, kNtpSeconds + 1000}};
  for (const Case& c : cases) {
    EXPECT_EQ(word(SenderReportWriter(c.reports, kBegan).write(first_of(7), seconds(1000)), 8), c.seconds);
  }
}

TEST(SenderReport, MaySpeakOfAnotherSource) {
  const SenderReportWriter writer({.every = 1, .other_ssrc = true}, kBegan);
  EXPECT_NE(word(writer.write(first_of(0), nanoseconds(0)), 4), 0x01020304u);
}

}  // namespace
}  // namespace vexa::camera
