#include "transport/wire/rtcp.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

namespace vexa {
namespace {

using Octets = std::vector<unsigned char>;

const Octets kReport = {0x80, 200, 0, 6,                  // version 2, no block, a sender report of 7 words
                        1,    2,   3, 4,                  // SSRC
                        0xe9, 0,   0, 1, 0x80, 0, 0, 0,   // NTP time
                        0,    1,   2, 3,                  // RTP time
                        0,    0,   0, 9, 0,    0, 1, 0};  // packets and bytes

Octets joined(std::initializer_list<Octets> parts) {
  Octets all;
  for (const Octets& part : parts) all.insert(all.end(), part.begin(), part.end());
  return all;
}

TEST(Rtcp, ASenderReportIsFoundInItsCompound) {
  const Octets description = {0x81, 202, 0, 1, 1, 2, 3, 4};
  const auto report = find_sender_report(joined({kReport, description}));
  ASSERT_TRUE(report);
  EXPECT_EQ(report->ssrc, 0x01020304u);
  EXPECT_EQ(report->ntp, 0xe900000180000000u);
  EXPECT_EQ(report->rtp_time, 0x00010203u);
}

TEST(Rtcp, ASenderReportMayFollowAReceiverReport) {
  const Octets receiver = {0x80, 201, 0, 1, 9, 9, 9, 9};
  EXPECT_TRUE(find_sender_report(joined({receiver, kReport})));
}

TEST(Rtcp, WhatDoesNotKeepToTheFormHasNoReport) {
  Octets other_version = kReport;
  other_version[0] = 0x40;
  Octets too_long = kReport;
  too_long[3] = 7;
  Octets too_short = kReport;
  too_short[3] = 3;
  const Octets description = {0x80, 202, 0, 0};
  EXPECT_FALSE(find_sender_report({}));
  EXPECT_FALSE(find_sender_report(other_version));
  EXPECT_FALSE(find_sender_report(too_long));
  EXPECT_FALSE(find_sender_report(too_short));
  EXPECT_FALSE(find_sender_report(joined({description, kReport}))) << "a report comes first";
}

TEST(Rtcp, AReportCutAtAnyByteIsNone) {
  for (std::size_t length = 0; length < kReport.size(); ++length) {
    // A copy of its own, so that reading past its end shows.
    const Octets cut(kReport.begin(), kReport.begin() + static_cast<std::ptrdiff_t>(length));
    EXPECT_FALSE(find_sender_report(cut)) << length;
  }
}

TEST(Rtcp, AReceiverReportIsWrittenWithADescription) {
  ReceptionReport report;
  report.reporter = 0x0a0b0c0d;
  report.source = 0x01020304;
  report.fraction_lost = 64;
  report.lost = 5;
  report.highest_sequence = 0x00010007;
  report.jitter = 9;
  report.last_report = 0x00018000;
  report.since_last_report = 65536;
  const Octets wanted = {0x81, 201, 0,    7,   0x0a, 0x0b, 0x0c, 0x0d, 1,    2,    3, 4,    64,  0, 0,
                         5,    0,   1,    0,   7,    0,    0,    0,    9,    0,    1, 0x80, 0,   0, 1,
                         0,    0,   0x81, 202, 0,    2,    0x0a, 0x0b, 0x0c, 0x0d, 1, 1,    'a', 0};
  EXPECT_EQ(receiver_report(report, "a"), wanted);
}

TEST(Rtcp, ADescriptionEndsWithOneToFourZerosAtAWholeWord) {
  for (std::size_t length = 0; length <= 300; ++length) {
    const Octets written = receiver_report({}, std::string(length, 'n'));
    ASSERT_EQ(written.size() % 4, 0u);
    const std::size_t text = std::min<std::size_t>(length, 255);
    const std::size_t zeros = written.size() - 32 - 4 - 4 - 2 - text;
    EXPECT_GE(zeros, 1u) << length;
    EXPECT_LE(zeros, 4u) << length;
    EXPECT_EQ(written.size(), 32 + 4 + 4u * (written[34] * 256u + written[35])) << length;
  }
}

TEST(Rtcp, LossesKeepTo24Bits) {
  ReceptionReport report;
  report.lost = 0x7fffffff;
  EXPECT_EQ(receiver_report(report, "")[13], 0x7f);
  report.lost = -0x7fffffff;
  EXPECT_EQ(receiver_report(report, "")[13], 0x80);
}

TEST(Rtcp, NtpTimesAreTakenAcrossTheEraOf2036) {
  constexpr std::int64_t kSecond = 1'000'000'000;
  const auto ntp = [](std::uint64_t seconds) { return seconds << 32; };
  EXPECT_EQ(unix_nanoseconds(ntp(2208988800u)), 0) << "1970";
  EXPECT_EQ(unix_nanoseconds(ntp(2208988800u) | 0x80000000u), kSecond / 2);
  EXPECT_EQ(unix_nanoseconds(ntp(4294967295u)), (4294967295 - 2208988800) * kSecond) << "2036-02-07 06:28:15";
  EXPECT_EQ(unix_nanoseconds(ntp(0)), (4294967296 - 2208988800) * kSecond) << "one second later";
  EXPECT_EQ(unix_nanoseconds(ntp(0x80000000u)), (2147483648 - 2208988800) * kSecond) << "1968";
}

}  // namespace
}  // namespace vexa
