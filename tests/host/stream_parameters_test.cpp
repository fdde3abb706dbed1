#include "host/stream_parameters.h"

#include <gtest/gtest.h>

#include <memory>
#include <string>
#include <vector>

#include "virtual_camera/codec/clip.h"

namespace vexa::host {
namespace {

using Bytes = std::vector<unsigned char>;

std::optional<StreamParameters> read(const Bytes& bytes) {
  // In an allocation of its own, so that a sanitizer sees a read past the end.
  const auto exact = std::make_unique<unsigned char[]>(bytes.size());
  std::copy(bytes.begin(), bytes.end(), exact.get());
  return read_stream_parameters(exact.get(), bytes.size());
}

std::string shown(const std::optional<StreamParameters>& stream) {
  if (!stream) return "nothing";
  return std::to_string(stream->width) + "x" + std::to_string(stream->height) + "@" +
         std::to_string(static_cast<int>(stream->frame_rate * 1000));
}

// A sequence parameter set field by field.
struct ParameterSet {
  std::uint32_t profile = 77;
  std::uint32_t chroma_format = 1;       // of the high profiles
  bool separate_planes = false;          // of chroma_format 3
  bool scaling_lists = false;            // of the high profiles
  std::uint32_t picture_order_type = 0;  // 0, 1 or 2
  std::uint32_t columns = 40;            // macroblocks
  std::uint32_t rows = 30;
  bool frames_only = true;
  bool cropping = false;
  std::uint32_t crop[4] = {0, 0, 0, 0};  // left, right, top, bottom
  bool usability = true;
  bool all_usability = false;  // every optional part before the timing
  bool timing = true;
  std::uint32_t ticks = 1;
  std::uint32_t scale = 50;
};

class BitWriter {
 public:
  void bits(std::uint64_t value, unsigned count) {
    for (; count > 0; --count) bits_.push_back((value >> (count - 1) & 1) != 0);
  }
  void flag(bool value) { bits_.push_back(value); }
  void ue(std::uint32_t value) {
    const std::uint64_t code = std::uint64_t{value} + 1;
    unsigned length = 0;
    while (code >> length > 1) ++length;
    bits(0, length);
    bits(code, length + 1);
  }
  // Behind a start code, with emulation prevention.
  [[nodiscard]] Bytes as_unit() const {
    Bytes bytes = {0, 0, 0, 1, 0x67};
    unsigned zeros = 0;
    for (std::size_t i = 0; i < bits_.size(); i += 8) {
      unsigned byte = 0;
      for (std::size_t k = 0; k < 8; ++k) byte = byte << 1 | (i + k < bits_.size() && bits_[i + k] ? 1u : 0u);
      if (zeros >= 2 && byte <= 3) {
        bytes.push_back(3);
        zeros = 0;
      }
      bytes.push_back(static_cast<unsigned char>(byte));
      zeros = byte == 0 ? zeros + 1 : 0;
    }
    return bytes;
  }

 private:
  std::vector<bool> bits_;
};

void write_chroma(BitWriter& out, const ParameterSet& set) {
  out.ue(set.chroma_format);
  if (set.chroma_format == 3) out.flag(set.separate_planes);
  out.ue(0);
  out.ue(0);
  out.flag(false);
  out.flag(set.scaling_lists);
  if (!set.scaling_lists) return;
  for (unsigned i = 0; i < (set.chroma_format == 3 ? 12u : 8u); ++i) {
    out.flag(i % 2 == 0);
    if (i % 2 == 0) {
      for (unsigned k = 0; k < (i < 6 ? 16u : 64u); ++k) out.ue(k % 2 == 0 ? 1 : 2);  // +1, -1
    }
  }
}

void write_usability(BitWriter& out, const ParameterSet& set) {
  out.flag(set.usability);
  if (!set.usability) return;
  out.flag(set.all_usability);
  if (set.all_usability) {
    out.bits(255, 8);
    out.bits(0x00040003, 32);
  }
  for (int part = 0; part < 3; ++part) {
    out.flag(set.all_usability);
    if (!set.all_usability) continue;
    if (part == 0) out.flag(true);
    if (part == 1) out.bits(0x1fffffff, 29);
    if (part == 2) out.bits(0x3, 2);
  }
  out.flag(set.timing);
  if (!set.timing) return;
  out.bits(set.ticks, 32);
  out.bits(set.scale, 32);
}

Bytes unit_of(const ParameterSet& set) {
  BitWriter out;
  out.bits(set.profile, 8);
  out.bits(0x0028, 16);
  out.ue(0);
  if (set.profile == 100) write_chroma(out, set);
  out.ue(0);
  out.ue(set.picture_order_type);
  if (set.picture_order_type == 0) out.ue(4);
  if (set.picture_order_type == 1) {
    out.flag(false);
    out.ue(2);
    out.ue(3);
    out.ue(2);
    out.ue(5);
    out.ue(6);
  }
  out.ue(1);
  out.flag(false);
  out.ue(set.columns - 1);
  out.ue(set.rows - 1);
  out.flag(set.frames_only);
  if (!set.frames_only) out.flag(true);
  out.flag(true);
  out.flag(set.cropping);
  for (unsigned side = 0; set.cropping && side < 4; ++side) out.ue(set.crop[side]);
  write_usability(out, set);
  out.flag(true);
  return out.as_unit();
}

TEST(StreamParameters, AreReadFromRealEncodersStreams) {
  const struct {
    const char* clip;
    const char* parameters;
  } cases[] = {{VEXA_CLIPS "/small.h264", "320x240@25000"},
               {VEXA_CLIPS "/slices.h264", "320x240@25000"},
               {VEXA_CLIPS "/low2m.h264", "640x480@25000"},
               {VEXA_CLIPS "/hd.h264", "1920x1080@25000"}};
  for (const auto& row : cases) {
    SCOPED_TRACE(row.clip);
    const auto clip = camera::Clip::load(row.clip);
    ASSERT_TRUE(clip);
    const auto picture = clip->access_units().front().as_delivered();
    EXPECT_EQ(shown(read(picture)), row.parameters);
  }
}

TEST(StreamParameters, FollowEveryBranchOfTheSyntax) {
  const struct {
    const char* what;
    ParameterSet set;
    const char* parameters;
  } cases[] = {
      {"main profile", {}, "640x480@25000"},
      {"high profile", {.profile = 100}, "640x480@25000"},
      {"scaling lists", {.profile = 100, .scaling_lists = true}, "640x480@25000"},
      {"4:4:4 with lists", {.profile = 100, .chroma_format = 3, .scaling_lists = true}, "640x480@25000"},
      {"order type 1", {.picture_order_type = 1}, "640x480@25000"},
      {"order type 2", {.picture_order_type = 2}, "640x480@25000"},
      {"fields", {.rows = 15, .frames_only = false}, "640x480@25000"},
      {"cropped 4:2:0", {.columns = 120, .rows = 68, .cropping = true, .crop = {0, 0, 0, 4}}, "1920x1080@25000"},
      {"cropped all round", {.cropping = true, .crop = {1, 2, 3, 4}}, "634x466@25000"},
      {"cropped fields", {.rows = 15, .frames_only = false, .cropping = true, .crop = {0, 0, 1, 1}}, "640x472@25000"},
      {"cropped 4:2:2", {.profile = 100, .chroma_format = 2, .cropping = true, .crop = {1, 0, 0, 1}}, "638x479@25000"},
      {"cropped 4:4:4", {.profile = 100, .chroma_format = 3, .cropping = true, .crop = {1, 0, 0, 1}}, "639x479@25000"},
      {"cropped planes",
       {.profile = 100, .chroma_format = 3, .separate_planes = true, .cropping = true, .crop = {1, 0, 0, 1}},
       "639x479@25000"},
      {"cropped grey", {.profile = 100, .chroma_format = 0, .cropping = true, .crop = {1, 0, 0, 1}}, "639x479@25000"},
      {"no usability information", {.usability = false}, "640x480@0"},
      {"all usability information", {.all_usability = true}, "640x480@25000"},
      {"no timing", {.timing = false}, "640x480@0"},
      {"29.97", {.ticks = 1001, .scale = 60000}, "640x480@29970"},
      {"ticks of zero", {.ticks = 0}, "640x480@0"},
      {"1000 pictures a second", {.scale = 2000}, "640x480@1000000"},
      {"more", {.scale = 2001}, "640x480@0"},
      {"the largest picture", {.columns = 1055, .rows = 1055}, "16880x16880@25000"},
      {"too wide", {.columns = 1056}, "nothing"},
      {"too high", {.rows = 1056}, "nothing"},
      {"cropped to one column", {.cropping = true, .crop = {0, 319, 0, 0}}, "2x480@25000"},
      {"cropped to nothing", {.cropping = true, .crop = {0, 320, 0, 0}}, "nothing"},
      {"cropped beyond", {.cropping = true, .crop = {0, 0, 0xfffffffe, 0xfffffffe}}, "nothing"},
  };
  for (const auto& row : cases) {
    SCOPED_TRACE(row.what);
    EXPECT_EQ(shown(read(unit_of(row.set))), row.parameters);
  }
}

TEST(StreamParameters, AreFoundBehindOtherUnitsAndBothStartCodes) {
  const Bytes unit = unit_of({});
  for (const std::size_t start : {0u, 1u}) {
    Bytes picture = {0, 0, 0, 1, 0x09, 0xf0, 0, 0, 1, 0x06, 5, 1, 0};
    picture.insert(picture.end(), unit.begin() + static_cast<std::ptrdiff_t>(start), unit.end());
    const Bytes slice = {0, 0, 1, 0x65, 0x88};
    picture.insert(picture.end(), slice.begin(), slice.end());
    EXPECT_EQ(shown(read(picture)), "640x480@25000");
  }
}

TEST(StreamParameters, ThatAreMissingOrCutGiveNothing) {
  EXPECT_EQ(shown(read({})), "nothing");
  EXPECT_EQ(shown(read({0, 0, 1})), "nothing");
  EXPECT_EQ(shown(read({0, 0, 1, 0x65, 0x88})), "nothing");
  const Bytes whole = unit_of({.usability = false});
  for (std::size_t length = 0; length + 1 < whole.size(); ++length) {
    SCOPED_TRACE(length);
    EXPECT_EQ(shown(read(Bytes(whole.begin(), whole.begin() + static_cast<std::ptrdiff_t>(length)))), "nothing");
  }
}

TEST(StreamParameters, CutInTheTimingKeepTheSize) {
  const Bytes whole = unit_of({});
  EXPECT_EQ(shown(read(Bytes(whole.begin(), whole.end() - 3))), "640x480@0");
}

TEST(StreamParameters, OfEndlessZerosGiveNothing) {
  Bytes zeros = {0, 0, 1, 0x67, 77, 0, 40};
  zeros.resize(1000, 0);
  EXPECT_EQ(shown(read(zeros)), "nothing");
}

}  // namespace
}  // namespace vexa::host
