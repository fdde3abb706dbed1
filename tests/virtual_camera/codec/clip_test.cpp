// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/codec/clip.h"

#include <gtest/gtest.h>

#include <fstream>
#include <iterator>
#include <string>
#include <vector>

namespace vexa::camera {
namespace {

using Buffer = std::vector<std::uint8_t>;

std::string clip_path(const std::string& name) { return std::string(VEXA_CLIPS) + "/" + name + ".h264"; }

Buffer file_bytes(const std::string& path) {
  std::ifstream file(path, std::ios::binary);
  const std::string text{std::istreambuf_iterator<char>(file), std::istreambuf_iterator<char>()};
  return {text.begin(), text.end()};
}

// Joins NAL units given by their bytes, each after a start code of its own length.
Buffer stream_of(const std::vector<std::pair<int, Buffer>>& units) {
  Buffer stream;
  for (const auto& [zeros, unit] : units) {
    stream.insert(stream.end(), static_cast<std::size_t>(zeros), 0);
    stream.push_back(1);
    stream.insert(stream.end(), unit.begin(), unit.end());
  }
  return stream;
}

const Buffer kSps{0x67, 0x42};
const Buffer kPps{0x68, 0xCE};
const Buffer kSei{0x06, 0x05};
const Buffer kAud{0x09, 0xF0};
const Buffer kIdr{0x65, 0x88};      // first_mb_in_slice 0
const Buffer kIdrNext{0x65, 0x40};  // a later slice of the same picture
const Buffer kDelta{0x41, 0x9A};
const Buffer kDeltaNext{0x41, 0x5A};

TEST(Clip, AccessUnitsBeginWhereH264DefinesIt) {
  const struct {
    const char* name;
    std::vector<Buffer> units;
    std::vector<std::size_t> sizes;  // NAL units of each access unit
  } cases[] = {{"slices of one macroblock 0 each", {kIdr, kDelta, kDelta}, {1, 1, 1}},
               {"parameter sets lead a picture", {kSps, kPps, kSei, kIdr, kDelta}, {4, 1}},
               {"parameter sets end the picture before", {kDelta, kSps, kPps, kIdr}, {1, 3}},
               {"several slices", {kSps, kPps, kIdr, kIdrNext, kDelta, kDeltaNext, kDeltaNext}, {4, 3}},
               {"delimiters", {kAud, kIdr, kIdrNext, kAud, kDelta}, {3, 2}},
               {"message before a delta picture", {kIdr, kSei, kDelta}, {1, 2}},
               {"end of sequence stays with its picture", {kDelta, {0x0A, 0x80}, kIdr}, {2, 1}},
               {"no slice at all", {kSps, kPps}, {2}}};
  for (const auto& c : cases) {
    std::vector<std::pair<int, Buffer>> units;
    for (const Buffer& unit : c.units) units.emplace_back(3, unit);
    std::vector<std::size_t> sizes;
    const Clip clip = Clip::from_annex_b(stream_of(units));
    for (const AccessUnit& unit : clip.access_units()) sizes.push_back(unit.units.size());
    EXPECT_EQ(sizes, c.sizes) << c.name;
  }
}

TEST(Clip, AccessUnitsKeepTheFilesBytesAndAreDeliveredAfterFourByteCodes) {
  const Buffer stream = stream_of({{3, kSps}, {2, kPps}, {2, kIdr}, {2, kDelta}});
  const Clip clip = Clip::from_annex_b(stream);
  ASSERT_EQ(clip.access_units().size(), 2U);
  const AccessUnit& key = clip.access_units()[0];
  EXPECT_EQ(key.bytes, stream_of({{3, kSps}, {2, kPps}, {2, kIdr}}));
  EXPECT_EQ(key.as_delivered(), stream_of({{3, kSps}, {3, kPps}, {3, kIdr}}));
  EXPECT_TRUE(key.key);
  EXPECT_FALSE(clip.access_units()[1].key);
}

TEST(Clip, ZerosAfterANalUnitAreNotPartOfIt) {
  const Clip clip = Clip::from_annex_b(stream_of({{3, {0x65, 0x88, 0, 0, 0}}, {3, kDelta}}));
  ASSERT_EQ(clip.access_units().size(), 2U);
  EXPECT_EQ(clip.access_units()[0].units[0].size, 2U);
}

TEST(Clip, BytesWithoutAStartCodeHoldNothing) {
  for (const Buffer& bytes : {Buffer{}, Buffer{0}, Buffer{0, 0, 1}, Buffer{0, 0, 0, 1}, Buffer{1, 2, 3, 4, 5, 6}}) {
    EXPECT_TRUE(Clip::from_annex_b(bytes).access_units().empty());
  }
  EXPECT_FALSE(Clip::load("/nowhere/clip.h264"));
}

TEST(Clip, EveryCutOfAStreamIsSplitWithoutHarm) {
  const Buffer stream = stream_of({{3, kSps}, {2, kPps}, {2, kIdr}, {3, kDelta}});
  for (std::size_t size = 0; size < stream.size(); ++size) {
    const Buffer cut(stream.begin(), stream.begin() + static_cast<std::ptrdiff_t>(size));
    EXPECT_LE(Clip::from_annex_b(cut).access_units().size(), 2U);
  }
}

// The encoder was asked for ten seconds of 25 pictures.
TEST(Clip, EncodersFilesSplitIntoTheirPicturesWithoutLosingAByte) {
  const struct {
    const char* name;
    std::size_t key_interval, slices;
  } cases[] = {{"small", 25, 1}, {"slices", 10, 4}, {"low2m", 25, 1}, {"hd", 25, 1}};
  for (const auto& c : cases) {
    const auto clip = Clip::load(clip_path(c.name));
    ASSERT_TRUE(clip) << c.name;
    ASSERT_EQ(clip->access_units().size(), 250U) << c.name;
    Buffer joined;
    for (std::size_t i = 0; i < 250; ++i) {
      const AccessUnit& unit = clip->access_units()[i];
      std::size_t slices = 0;
      for (const NalUnit& nal : unit.units) slices += nal.type == 1 || nal.type == 5 ? 1 : 0;
      EXPECT_EQ(slices, c.slices) << c.name << " " << i;
      EXPECT_EQ(unit.key, i % c.key_interval == 0) << c.name << " " << i;
      joined.insert(joined.end(), unit.bytes.begin(), unit.bytes.end());
    }
    EXPECT_TRUE(joined == file_bytes(clip_path(c.name))) << c.name;
  }
}

}  // namespace
}  // namespace vexa::camera
