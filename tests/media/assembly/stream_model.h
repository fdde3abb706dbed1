// SPDX-License-Identifier: Apache-2.0
// A made-up H.264 stream, cut into packets, for tests of the collection: no socket and no clock.
#pragma once

#include <algorithm>
#include <chrono>
#include <cstdint>
#include <deque>
#include <random>
#include <string>
#include <vector>

#include "vexa/video_info.h"

namespace vexa::test {

struct StreamStart {
  std::uint16_t sequence = 1;
  std::uint32_t timestamp = 20'000'000;
};

/// One picture and its packets' numbers.
struct ModelPicture {
  bool key = false;
  std::vector<SPacketInfo> packets;
};

/// Owns the bytes of the packets that it makes.
class ModelStream {
 public:
  static constexpr int kClockRate = 90000;
  static constexpr std::uint32_t kTicksAPicture = 3600;  // 25 pictures a second

  explicit ModelStream(StreamStart start = {}) : sequence_(start.sequence), timestamp_(start.timestamp) {}

  /// SPS, PPS and an IDR slice in `fragments` fragments.
  ModelPicture key_picture(int fragments) {
    ModelPicture picture{true, {}};
    picture.packets.push_back(packet({0x67, 1, 2}));
    picture.packets.push_back(packet({0x68, 3}));
    add_fragments(picture, {.unit = 5, .count = fragments});
    return finish(picture);
  }

  /// Two IDR slices, a packet each, neither of which shows by itself that it is the picture's first.
  ModelPicture bare_key_picture() {
    ModelPicture picture{true, {}};
    for (int i = 0; i < 2; ++i) picture.packets.push_back(packet({0x65, 0x08}));
    return finish(picture);
  }

  /// One slice that refers to others, in `fragments` fragments.
  ModelPicture delta_picture(int fragments) {
    ModelPicture picture;
    add_fragments(picture, {.unit = 1, .count = fragments});
    return finish(picture);
  }

  /// `count` pictures, a key picture first and then every `interval`.
  std::vector<ModelPicture> pictures(int count, int interval, std::mt19937& random) {
    std::vector<ModelPicture> all;
    for (int i = 0; i < count; ++i) {
      const int fragments = std::uniform_int_distribution<int>(2, 9)(random);
      all.push_back(i % interval == 0 ? key_picture(3 * fragments) : delta_picture(fragments));
    }
    return all;
  }

 private:
  struct Fragments {
    std::uint8_t unit;
    int count;
  };

  void add_fragments(ModelPicture& picture, Fragments fragments) {
    for (int i = 0; i < fragments.count; ++i) {
      const int edges = (i == 0 ? 0x80 : 0) | (i == fragments.count - 1 ? 0x40 : 0);
      picture.packets.push_back(packet({0x7c, static_cast<unsigned char>(edges | fragments.unit), 0x80, 7}));
    }
  }

  SPacketInfo packet(std::initializer_list<unsigned char> payload) {
    std::vector<unsigned char> bytes(12);
    bytes.insert(bytes.end(), payload);
    bytes_.push_back(std::move(bytes));
    SPacketInfo info;
    info.data = bytes_.back().data();
    info.length = static_cast<std::uint32_t>(bytes_.back().size());
    info.received = true;
    info.payloadType = 96;
    info.sequence = sequence_++;
    info.timestamp = timestamp_;
    return info;
  }

  ModelPicture finish(ModelPicture& picture) {
    picture.packets.back().marker = true;
    timestamp_ += kTicksAPicture;
    return picture;
  }

  std::deque<std::vector<unsigned char>> bytes_;
  std::uint16_t sequence_;
  std::uint32_t timestamp_;
};

}  // namespace vexa::test
