// SPDX-License-Identifier: Apache-2.0
#include "bench/peers/made_stream.h"

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <random>

namespace vexa_peers {
namespace {

constexpr std::size_t kPayload = 1400;
constexpr double kLargest = 1100000;  // bytes of a picture
constexpr std::uint64_t kGroup = 25;  // pictures from one key picture to the next

// No byte is 0, so that no start code appears.
Payload filling(std::size_t length, std::mt19937& random) {
  Payload bytes(length);
  for (unsigned char& byte : bytes) byte = static_cast<unsigned char>(1 + random() % 254);
  return bytes;
}

Picture h264_picture(const Payload& content, bool is_key) {
  Picture picture;
  if (is_key) picture.payloads = {{0x67, 0x42, 0x00, 0x1e, 0x95}, {0x68, 0xce, 0x3c, 0x80}};
  const unsigned char type = is_key ? 5 : 1;
  for (std::size_t at = 0; at < content.size(); at += kPayload - 2) {
    const std::size_t length = std::min(kPayload - 2, content.size() - at);
    const bool first = at == 0;
    const bool last = at + length == content.size();
    Payload fragment = {0x7c, static_cast<unsigned char>(type | (first ? 0x80 : 0) | (last ? 0x40 : 0))};
    fragment.insert(fragment.end(), content.begin() + static_cast<std::ptrdiff_t>(at),
                    content.begin() + static_cast<std::ptrdiff_t>(at + length));
    picture.payloads.push_back(std::move(fragment));
  }
  return picture;
}

Picture mpeg4_picture(Payload content, bool is_key) {
  const Payload key = {0, 0, 1, 0xb0, 0x01, 0, 0, 1, 0xb6, 0x10};
  const Payload delta = {0, 0, 1, 0xb6, 0x50};
  const Payload& head = is_key ? key : delta;
  content.insert(content.begin(), head.begin(), head.end());
  Picture picture;
  for (std::size_t at = 0; at < content.size(); at += kPayload) {
    const auto begin = content.begin() + static_cast<std::ptrdiff_t>(at);
    picture.payloads.emplace_back(begin, begin + static_cast<std::ptrdiff_t>(std::min(kPayload, content.size() - at)));
  }
  return picture;
}

Picture jpeg_picture(const Payload& content) {
  Picture picture;
  for (std::size_t at = 0; at < content.size(); at += kPayload - 8) {
    const std::size_t length = std::min(kPayload - 8, content.size() - at);
    Payload part = {0,
                    static_cast<unsigned char>(at >> 16),
                    static_cast<unsigned char>(at >> 8 & 255),
                    static_cast<unsigned char>(at & 255),
                    1,
                    50,
                    160,
                    90};
    part.insert(part.end(), content.begin() + static_cast<std::ptrdiff_t>(at),
                content.begin() + static_cast<std::ptrdiff_t>(at + length));
    picture.payloads.push_back(std::move(part));
  }
  return picture;
}

}  // namespace

void write_stamp(unsigned char* place, std::int64_t nanoseconds) {
  char text[kStampLength + 1];
  std::snprintf(text, sizeof text, "T=%016llx", static_cast<unsigned long long>(nanoseconds));
  std::memcpy(place, text, kStampLength);
}

std::int64_t read_stamp(const unsigned char* data, std::size_t length) {
  const std::size_t near = std::min(length, kStampLength + 16);
  const auto* found = static_cast<const unsigned char*>(memmem(data + length - near, near, "T=", 2));
  if (found == nullptr || static_cast<std::size_t>(data + length - found) < kStampLength) return 0;
  char digits[17] = {};
  std::memcpy(digits, found + 2, 16);
  return static_cast<std::int64_t>(std::strtoull(digits, nullptr, 16));
}

MadeStream::MadeStream(const Options& options) {
  const bool is_jpeg = options.codec == "jpeg";
  payload_type_ = is_jpeg ? 26 : 96;
  encoding_ = is_jpeg ? "JPEG" : options.codec == "mpeg4" ? "MP4V-ES" : "H264";
  std::mt19937 random(options.seed);
  const double mean = options.megabits * 1e6 / 8 / options.frames_per_second;
  // Of JPEG all are alike, and so are pictures that a frame buffer would not hold four times.
  const bool alike = is_jpeg || 4 * mean > kLargest;
  const double delta = alike ? mean : mean * static_cast<double>(kGroup) / static_cast<double>(kGroup + 3);
  for (std::uint64_t i = 0; i < kGroup; ++i) {
    const bool is_key = i == 0 || alike;
    const double vary = is_key ? 1 : 0.67 + 0.66 * static_cast<double>(random() % 1000) / 1000;
    const double size = std::max(delta * vary * (is_key && !alike ? 4 : 1), 64.0);
    const Payload content = filling(static_cast<std::size_t>(size), random);
    pictures_.push_back(is_jpeg                    ? jpeg_picture(content)
                        : options.codec == "mpeg4" ? mpeg4_picture(content, is_key)
                                                   : h264_picture(content, is_key));
    // The stamp lies in one datagram.
    Payload& last = pictures_.back().payloads.back();
    if (last.size() < kStampLength + 10) last.resize(kStampLength + 10, 0x55);
  }
}

const Picture& MadeStream::picture(std::uint64_t number) const {
  return pictures_[static_cast<std::size_t>(number % kGroup)];
}

std::string MadeStream::description() const {
  const std::string type = std::to_string(payload_type_);
  return "v=0\r\no=- 1 1 IN IP4 " + std::string(kAddress) + "\r\ns=stream\r\nt=0 0\r\nm=video 0 RTP/AVP " + type +
         "\r\nc=IN IP4 0.0.0.0\r\na=rtpmap:" + type + " " + encoding_ + "/90000\r\na=control:video\r\n";
}

}  // namespace vexa_peers
