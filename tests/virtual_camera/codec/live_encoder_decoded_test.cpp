// Pictures as they come out of the encoder, decoded by decoders that are not ours.
#include <gtest/gtest.h>
// Needs <cstdio> before it.
#include <jpeglib.h>

#include <cmath>
#include <cstdlib>
#include <string>
#include <vector>

#include "tests/support/temporary_folder.h"
#include "virtual_camera/codec/clip.h"
#include "virtual_camera/codec/jpeg_picture.h"
#include "virtual_camera/codec/live_encoder.h"
#include "virtual_camera/scene/scene.h"

namespace vexa::camera {
namespace {

constexpr PictureSize kSize{320, 192};

// Somebody walks through the scene while the camera turns.
I420Picture seen(int index, PictureSize size = kSize) {
  const View view{{index * 0.5, -2, 50, ""}, size, false};
  SceneMoment moment;
  moment.clock = std::chrono::milliseconds(40 * index);
  moment.presets = {{12, 10, -5}};
  moment.intruder = Intruder{index * 0.7 - 5, -10, 8, index * 0.1};
  I420Picture picture;
  render(view, moment, picture);
  return picture;
}

LiveEncoding small_encoding(Codec codec) { return {codec, kSize.width, kSize.height, 25, 1000, 8, 5}; }

EncodedPicture encoded(LiveEncoder& encoder, const I420Picture& picture) {
  auto result = encoder.encode(picture);
  if (auto* got = std::get_if<EncodedPicture>(&result)) return std::move(*got);
  ADD_FAILURE() << std::get<std::string>(result);
  return {};
}

std::vector<EncodedPicture> encode_all(const LiveEncoding& encoding, int pictures) {
  auto opened = LiveEncoder::open(encoding);
  if (const auto* error = std::get_if<std::string>(&opened)) {
    ADD_FAILURE() << *error;
    return {};
  }
  std::vector<EncodedPicture> all;
  for (int i = 0; i < pictures; ++i) {
    all.push_back(encoded(std::get<LiveEncoder>(opened), seen(i, {encoding.width, encoding.height})));
  }
  return all;
}

// What ffmpeg makes of all access units in a row: planes, picture behind picture. Empty when anything displeased it.
std::string decode_planes(const std::vector<EncodedPicture>& pictures, const std::string& format) {
  const vexa_test::TemporaryFolder folder;
  std::string bytes;
  for (const EncodedPicture& picture : pictures) bytes.append(picture.bytes.begin(), picture.bytes.end());
  const std::string in = folder.make_file("in", bytes);
  const std::string command = "ffmpeg -v warning -nostdin -xerror -err_detect explode -f " + format + " -i '" + in +
                              "' -fps_mode passthrough -f rawvideo '" + folder / "out" + "' 2>'" + folder / "said" +
                              "'";
  if (std::system(command.c_str()) != 0) return "";  // NOLINT(concurrency-mt-unsafe): nothing else runs
  EXPECT_EQ(vexa_test::contents_of(folder / "said"), "");
  return vexa_test::contents_of(folder / "out");
}

// Of bytes against others; in decibels.
double signal_to_noise(const std::uint8_t* original, const char* decoded, std::size_t bytes) {
  double squares = 0;
  for (std::size_t i = 0; i < bytes; ++i) {
    const double off = original[i] - static_cast<unsigned char>(decoded[i]);
    squares += off * off;
  }
  return 10 * std::log10(255.0 * 255.0 * static_cast<double>(bytes) / (squares + 1e-9));
}

struct Case {
  Codec codec;
  const char* format;
  const char* name;
};

class LiveEncoderOf : public testing::TestWithParam<Case> {};

TEST_P(LiveEncoderOf, GivesOneAccessUnitAPictureThatDecodesToIt) {
  constexpr int kPictures = 12;
  const auto pictures = encode_all(small_encoding(GetParam().codec), kPictures);
  const std::string planes = decode_planes(pictures, GetParam().format);
  const std::size_t size = seen(0).bytes().size();
  ASSERT_EQ(planes.size(), kPictures * size);
  for (int i = 0; i < kPictures; ++i) {
    const char* decoded = planes.data() + static_cast<std::size_t>(i) * size;
    EXPECT_GT(signal_to_noise(seen(i).bytes().data(), decoded, size), 30) << i;
    EXPECT_LT(signal_to_noise(seen(i + 1).bytes().data(), decoded, size), 25) << "none but this one";
  }
}

TEST_P(LiveEncoderOf, MakesKeyPicturesAtTheIntervalAndWhenAsked) {
  const bool all = GetParam().codec == Codec::kJpeg;
  auto opened = LiveEncoder::open(small_encoding(GetParam().codec));
  auto& encoder = std::get<LiveEncoder>(opened);
  std::string keys;
  for (int i = 0; i < 13; ++i) {
    if (i == 7) encoder.ask_for_key();
    keys += encoded(encoder, seen(i)).key ? 'K' : '.';
  }
  EXPECT_EQ(keys, all ? "KKKKKKKKKKKKK" : "K....K.K....K");
}

TEST_P(LiveEncoderOf, RefusesAPictureOfAnotherSizeAndGoesOn) {
  auto opened = LiveEncoder::open(small_encoding(GetParam().codec));
  auto& encoder = std::get<LiveEncoder>(opened);
  EXPECT_EQ(std::get<std::string>(encoder.encode(I420Picture(322, 192))), "a picture of another size");
  EXPECT_EQ(std::get<std::string>(encoder.encode(I420Picture(320, 190))), "a picture of another size");
  EXPECT_TRUE(encoded(encoder, seen(0)).key);
}

TEST_P(LiveEncoderOf, EncodesAtEveryRateAndInTheLeastAndOddestSizes) {
  for (const int rate : {1, 2, 30, 60}) {
    LiveEncoding encoding = small_encoding(GetParam().codec);
    encoding.frame_rate = rate;
    encoding.key_interval = 0;
    EXPECT_EQ(encode_all(encoding, 2).back().key, GetParam().codec == Codec::kJpeg || rate == 1) << rate;
  }
  for (const PictureSize size : {PictureSize{48, 32}, {176, 150}}) {
    LiveEncoding encoding = small_encoding(GetParam().codec);
    encoding.width = size.width;
    encoding.height = size.height;
    const auto pictures = encode_all(encoding, 2);
    EXPECT_EQ(decode_planes(pictures, GetParam().format).size(), 2U * seen(0, size).bytes().size()) << size.height;
  }
}

TEST_P(LiveEncoderOf, MakesMoreBytesOfMoreBitsOrBetterQuality) {
  const auto bytes_of = [](const LiveEncoding& encoding) {
    std::size_t bytes = 0;
    for (const EncodedPicture& picture : encode_all(encoding, 25)) bytes += picture.bytes.size();
    return bytes;
  };
  LiveEncoding poor = small_encoding(GetParam().codec);
  poor.bit_rate = 64;
  poor.quality = 1;
  LiveEncoding rich = poor;
  rich.bit_rate = 2000;
  rich.quality = 10;
  EXPECT_GT(bytes_of(rich), bytes_of(poor) * 3 / 2);
}

INSTANTIATE_TEST_SUITE_P(Codecs, LiveEncoderOf,
                         testing::Values(Case{Codec::kJpeg, "mjpeg", "Jpeg"}, Case{Codec::kMpeg4, "m4v", "Mpeg4"},
                                         Case{Codec::kH264, "h264", "H264"}),
                         [](const auto& tested) { return std::string(tested.param.name); });

TEST(LiveH264, BeginsKeyPicturesWithParameterSetsAndHasNoOtherUnits) {
  for (const EncodedPicture& picture : encode_all(small_encoding(Codec::kH264), 6)) {
    const Clip clip = Clip::from_annex_b(picture.bytes);
    ASSERT_EQ(clip.access_units().size(), 1U);
    std::vector<int> types;
    for (const NalUnit& unit : clip.access_units().front().units) types.push_back(unit.type);
    EXPECT_EQ(types, picture.key ? (std::vector<int>{7, 8, 5}) : (std::vector<int>{1}));
    EXPECT_EQ(clip.access_units().front().as_delivered(), picture.bytes) << "start codes of four bytes";
  }
}

TEST(LiveMpeg4, BeginsKeyPicturesWithHeadersAndHasNoUserData) {
  for (const EncodedPicture& picture : encode_all(small_encoding(Codec::kMpeg4), 6)) {
    const std::string bytes(picture.bytes.begin(), picture.bytes.end());
    const std::string start("\0\0\1", 3);
    EXPECT_EQ(bytes.substr(0, 4), start + (picture.key ? "\xB0" : "\xB6"));
    EXPECT_EQ(bytes.find(start + "\xB2"), std::string::npos);
    EXPECT_EQ(bytes.find(start + "\xB6") != std::string::npos, true);
  }
}

// Warnings of the reference decoder over a whole picture.
long jpeg_warnings(const std::vector<std::uint8_t>& file) {
  jpeg_decompress_struct decoder{};
  jpeg_error_mgr error{};
  decoder.err = jpeg_std_error(&error);
  jpeg_create_decompress(&decoder);
  jpeg_mem_src(&decoder, file.data(), file.size());
  jpeg_read_header(&decoder, TRUE);
  jpeg_start_decompress(&decoder);
  std::vector<unsigned char> line(std::size_t{decoder.output_width} * 3);
  while (decoder.output_scanline < decoder.output_height) {
    unsigned char* place = line.data();
    jpeg_read_scanlines(&decoder, &place, 1);
  }
  jpeg_finish_decompress(&decoder);
  jpeg_destroy_decompress(&decoder);
  return error.num_warnings;
}

TEST(LiveJpeg, CanTravelOverRtpAtEveryQualityAndDecodesWithoutAWarning) {
  for (int quality = 1; quality <= 10; ++quality) {
    LiveEncoding encoding = small_encoding(Codec::kJpeg);
    encoding.quality = quality;
    const auto pictures = encode_all(encoding, 1);
    const auto jpeg = read_jpeg(pictures.front().bytes);
    ASSERT_TRUE(jpeg) << quality;
    EXPECT_EQ(jpeg->width, 320U);
    EXPECT_EQ(jpeg->height, 192U);
    EXPECT_EQ(jpeg->restart_interval, 0);
    EXPECT_EQ(jpeg_warnings(pictures.front().bytes), 0) << quality;
  }
}

}  // namespace
}  // namespace vexa::camera
