// SPDX-License-Identifier: Apache-2.0
#include "media/assembly/rtp_pictures.h"

#include <gtest/gtest.h>

#include <vector>

#include "tests/media/assembly/packet_bytes.h"

namespace vexa::test {
namespace {

struct PictureCase {
  const char* what;
  std::vector<Payload> payloads;
  Payload frame;
  std::int32_t type;
};

const PictureCase kPictures[] = {
    {"a single slice", {{0x41, 1, 2}}, {0, 0, 0, 1, 0x41, 1, 2}, 22},
    {"a single IDR slice", {{0x65, 9}}, {0, 0, 0, 1, 0x65, 9}, 20},
    {"SPS and IDR slice", {{0x67, 1}, {0x65, 2}}, {0, 0, 0, 1, 0x67, 1, 0, 0, 0, 1, 0x65, 2}, 20},
    {"SPS and PPS alone", {{0x67, 1}, {0x68, 2}}, {0, 0, 0, 1, 0x67, 1, 0, 0, 0, 1, 0x68, 2}, -1},
    {"a last SEI hides the type", {{0x65, 2}, {0x06, 5}}, {0, 0, 0, 1, 0x65, 2, 0, 0, 0, 1, 0x06, 5}, -1},
    {"type 23 is the last single unit", {{0x77, 1}}, {0, 0, 0, 1, 0x77, 1}, -1},
    {"an IDR slice in three fragments",
     {{0x7c, 0x85, 1, 2}, {0x7c, 0x05, 3}, {0x7c, 0x45, 4, 5}},
     {0, 0, 0, 1, 0x65, 1, 2, 3, 4, 5},
     20},
    {"the reference bits come from the indicator", {{0x3c, 0x81, 7}}, {0, 0, 0, 1, 0x21, 7}, 22},
    {"the forbidden bit is left out", {{0xfc, 0x81, 7}}, {0, 0, 0, 1, 0x61, 7}, 22},
    {"a fragmented SEI tells no type",
     {{0x7c, 0x81, 7}, {0x7c, 0x86, 7}},
     {0, 0, 0, 1, 0x61, 7, 0, 0, 0, 1, 0x66, 7},
     -1},
    {"type 29 keeps its decoding order number", {{0x7d, 0x85, 0, 1, 7}}, {0, 0, 0, 1, 0x65, 0, 1, 7}, 20},
    {"fragments without a start are joined all the same", {{0x7c, 0x05, 3}, {0x7c, 0x45, 4}}, {3, 4}, -1},
    {"a packet without a payload adds nothing", {{}, {0x41, 1}, {}}, {0, 0, 0, 1, 0x41, 1}, 22},
    {"a fragment without a body begins the unit", {{0x7c, 0x85}}, {0, 0, 0, 1, 0x65}, 20},
    {"no payload at all", {{}}, {}, -1},
};

TEST(H264Units, RebuildsEachPictureByteForByte) {
  for (const PictureCase& picture : kPictures) {
    Payload frame(picture.frame.size());
    const AssembledPicture made = assemble_h264(Packets(picture.payloads), frame);
    EXPECT_EQ(made.outcome, Assembly::kWhole) << picture.what;
    EXPECT_EQ(made.length, picture.frame.size()) << picture.what;
    EXPECT_EQ(frame, picture.frame) << picture.what;
    EXPECT_EQ(made.frame_type, picture.type) << picture.what;
  }
}

TEST(H264Units, EverySingleUnitAndEveryFragmentedOneGivesTheFramesType) {
  for (int type = 0; type < 32; ++type) {
    const std::int32_t expected = type == 1 ? 22 : type == 5 ? 20 : -1;
    const auto unit = static_cast<unsigned char>(0x60 | type);
    Payload frame(100);
    // The type before is another one: each unit sets its own.
    const Payload before = {static_cast<unsigned char>(type == 5 ? 0x61 : 0x65), 1};
    if (type >= 1 && type <= 23) {
      const AssembledPicture single = assemble_h264(Packets(std::vector<Payload>{before, {unit, 9}}), frame);
      EXPECT_EQ(single.outcome, Assembly::kWhole) << type;
      EXPECT_EQ(single.frame_type, expected) << type;
    }
    const Payload start = {0x7c, static_cast<unsigned char>(0x80 | type), 9};
    EXPECT_EQ(assemble_h264(Packets(std::vector<Payload>{before, start}), frame).frame_type, expected) << type;
    EXPECT_EQ(frame[10], unit) << type;
    const Payload end = {0x7c, static_cast<unsigned char>(0x40 | type), 9};
    EXPECT_EQ(assemble_h264(Packets(std::vector<Payload>{before, end}), frame).frame_type, type == 5 ? 22 : 20) << type;
  }
}

TEST(H264Units, AFragmentOfType29IsReadLikeOneOfType28) {
  Payload frame(100);
  const AssembledPicture made = assemble_h264(Packets(std::vector<Payload>{{0x7d, 0x81, 0xaa, 0xbb, 1}}), frame);
  frame.resize(made.length);
  EXPECT_EQ(frame, (Payload{0, 0, 0, 1, 0x61, 0xaa, 0xbb, 1}));
}

TEST(H264Units, AFrameOneByteTooSmallIsTooSmallForEachPicture) {
  for (const PictureCase& picture : kPictures) {
    if (picture.frame.empty()) continue;
    Payload frame(picture.frame.size() - 1);
    EXPECT_EQ(assemble_h264(Packets(picture.payloads), frame).outcome, Assembly::kTooLarge) << picture.what;
  }
}

TEST(H264Units, OtherPacketKindsAreNotOffered) {
  for (const int type : {0, 24, 25, 26, 27, 30, 31}) {
    Payload frame(100);
    const Packets packets({{0x41, 1}, {static_cast<unsigned char>(0x60 | type), 1, 2, 3}});
    EXPECT_EQ(assemble_h264(packets, frame).outcome, Assembly::kUnsupported) << type;
  }
}

TEST(H264Units, TheLengthsInAnAggregationPacketAreNotRead) {
  for (const Payload& packet : {Payload{0x78}, Payload{0x78, 0}, Payload{0x78, 0, 0}, Payload{0x78, 0xff, 0xff, 0x65},
                                Payload{0x78, 0, 2, 0x65, 1, 0xff, 0xff}}) {
    Payload frame(100);
    EXPECT_EQ(assemble_h264(Packets(std::vector<Payload>{packet}), frame).outcome, Assembly::kUnsupported);
  }
}

TEST(H264Units, AFragmentCutBeforeItsHeaderIsNotTaken) {
  Payload frame(100);
  EXPECT_EQ(assemble_h264(Packets(std::vector<Payload>{{0x7c}}), frame).outcome, Assembly::kUnsupported);
}

struct KeyCase {
  const char* what;
  std::vector<Payload> payloads;
  bool key;
};

TEST(H264Units, AnIdrSliceInAnyPacketMakesAKeyPicture) {
  const KeyCase cases[] = {
      {"one packet", {{0x65, 0x88}}, true},
      {"many packets", {{0x7c, 0x85, 0x88}, {0x7c, 0x45, 1}}, true},
      {"behind parameter sets", {{0x67, 1}, {0x68, 1}, {0x65, 0x88}}, true},
      {"before an SEI", {{0x65, 0x88}, {0x06, 1}}, true},
      {"a slice that refers to others", {{0x41, 0x9a}}, false},
      {"parameter sets alone", {{0x67, 1}, {0x68, 1}}, false},
      {"fragments of an IDR slice without its start", {{0x7c, 0x05, 1}, {0x7c, 0x45, 1}}, false},
      {"nothing", {{}}, false},
  };
  for (const KeyCase& c : cases) EXPECT_EQ(kH264Rules.is_key(Packets(c.payloads)), c.key) << c.what;
}

struct OpeningCase {
  const char* what;
  Payload first;
  std::uint8_t opening;
  bool whole;        // for a camera that sends parameter sets
  bool whole_alone;  // for one that does not
};

TEST(H264Units, TheFirstPacketShowsHowAPictureOpens) {
  const OpeningCase cases[] = {
      {"delimiter", {0x09, 0x10}, 9, true, true},
      {"sequence parameter set", {0x67, 1}, 7, true, true},
      {"picture parameter set", {0x68, 1}, 8, false, true},
      {"SEI", {0x06, 1}, 6, false, true},
      {"first slice", {0x65, 0x88}, 5, false, true},
      {"later slice", {0x65, 0x08}, 0, false, true},
      {"slice without a header", {0x65}, 0, false, true},
      {"first slice, fragmented", {0x7c, 0x85, 0x88}, 5, false, true},
      {"later slice, fragmented", {0x7c, 0x85, 0x08}, 0, false, true},
      {"middle of a fragmented unit", {0x7c, 0x05, 0x88}, 0, false, false},
      {"fragment without a body", {0x7c, 0x85}, 0, false, true},
      {"nothing", {}, 0, false, false},
  };
  for (const OpeningCase& c : cases) {
    const Packets packets(std::vector<Payload>{c.first});
    EXPECT_EQ(kH264Rules.opening(packets.front()), c.opening) << c.what;
    EXPECT_EQ(kH264Rules.opens_whole(packets, true), c.whole) << c.what;
    EXPECT_EQ(kH264Rules.opens_whole(packets, false), c.whole_alone) << c.what;
  }
}

TEST(H264Units, SupplementalInformationIsASingleUnitOfType6) {
  struct {
    const char* what;
    Payload payload;
    bool is;
  } const cases[] = {
      {"a SEI unit", {0x06, 5, 16}, true},
      {"one with reference bits", {0x66, 5}, true},
      {"the header alone", {0x06}, true},
      {"a slice", {0x41, 6}, false},
      {"a fragment of a SEI unit", {0x7c, 0x86, 6}, false},
      {"nothing", {}, false},
  };
  for (const auto& c : cases) {
    const Packets packets({c.payload});
    const Bytes found = supplemental_information(packets.front());
    EXPECT_EQ(Payload(found.begin(), found.end()), c.is ? c.payload : Payload{}) << c.what;
  }
}

}  // namespace
}  // namespace vexa::test
