// SPDX-License-Identifier: Apache-2.0
#include <gtest/gtest.h>
// Needs <cstdio> before it.
#include <jpeglib.h>

#include <csetjmp>
#include <string>
#include <vector>

#include "media/assembly/jfif_header.h"
#include "tests/media/video_transports.h"

namespace vexa_test {
namespace {

/// A decoded picture, and whether the decoder complained.
struct DecodedJpeg {
  unsigned width = 0;
  unsigned height = 0;
  long warnings = -1;  ///< -1: not decoded
  std::vector<unsigned char> pixels;
};

struct JumpOnError {
  jpeg_error_mgr manager;
  std::jmp_buf place;
};

[[noreturn]] void jump_on_error(j_common_ptr decoder) {
  std::longjmp(reinterpret_cast<JumpOnError*>(decoder->err)->place, 1);
}
void stay_silent(j_common_ptr) {}

void read_lines(jpeg_decompress_struct& decoder, DecodedJpeg& decoded) {
  const std::size_t line = std::size_t{decoder.output_width} * 3;
  decoded.width = decoder.output_width;
  decoded.height = decoder.output_height;
  decoded.pixels.resize(line * decoder.output_height);
  while (decoder.output_scanline < decoder.output_height) {
    unsigned char* place = decoded.pixels.data() + line * decoder.output_scanline;
    jpeg_read_scanlines(&decoder, &place, 1);
  }
}

void decode_jpeg(const std::string& bytes, DecodedJpeg& decoded) {
  jpeg_decompress_struct decoder{};
  JumpOnError error{};
  decoder.err = jpeg_std_error(&error.manager);
  error.manager.error_exit = jump_on_error;
  error.manager.output_message = stay_silent;
  if (setjmp(error.place) == 0) {
    jpeg_create_decompress(&decoder);
    jpeg_mem_src(&decoder, reinterpret_cast<const unsigned char*>(bytes.data()), bytes.size());
    jpeg_read_header(&decoder, TRUE);
    decoder.out_color_space = JCS_YCbCr;
    jpeg_start_decompress(&decoder);
    read_lines(decoder, decoded);
    jpeg_finish_decompress(&decoder);
    decoded.warnings = error.manager.num_warnings;
  }
  jpeg_destroy_decompress(&decoder);
}

class DecodedJpegStream : public testing::TestWithParam<const char*> {
 protected:
  static void expect_encoders_pixels(VideoTransport transport) {
    const auto options = options_for_all_transports(GetParam());
    const auto clip = vexa::camera::ImageClip::load(options.image_path);
    LiveCamera camera(options);
    const auto frames = frames_by(transport, camera, 25);
    ASSERT_EQ(frames.size(), 25u);
    for (std::size_t i = 0; i < frames.size(); ++i) {
      DecodedJpeg arrived;
      decode_jpeg(frames[i], arrived);
      DecodedJpeg encoded;
      decode_jpeg(clip->pictures()[i], encoded);
      ASSERT_EQ(encoded.warnings, 0) << i;
      ASSERT_EQ(arrived.warnings, 0) << i;
      EXPECT_EQ(arrived.width, 320u);
      EXPECT_EQ(arrived.height, 240u);
      ASSERT_TRUE(arrived.pixels == encoded.pixels) << i;
    }
  }
};

TEST_P(DecodedJpegStream, EqualsTheEncodersPicturePixelForPixelWithoutAWarning) {
  for (const VideoTransport transport : {VideoTransport::kUdp, VideoTransport::kInterleaved, VideoTransport::kHttp})
    expect_encoders_pixels(transport);
}

INSTANTIATE_TEST_SUITE_P(Clips, DecodedJpegStream, testing::Values("plain.mjpeg", "restart.mjpeg", "sliced.mjpeg"),
                         [](const auto& tested) {
                           const std::string name = tested.param;
                           return name.substr(0, name.find('.'));
                         });

/// What the reference encoder would write at a quality, in rows.
TEST(DecodedJpeg, TablesOfAQualityAreTheReferenceEncoders) {
  jpeg_compress_struct encoder{};
  jpeg_error_mgr error{};
  encoder.err = jpeg_std_error(&error);
  jpeg_create_compress(&encoder);
  encoder.in_color_space = JCS_YCbCr;
  encoder.input_components = 3;
  jpeg_set_defaults(&encoder);
  for (int q = 1; q <= 99; ++q) {
    jpeg_set_quality(&encoder, q, TRUE);
    const auto tables = vexa::quantisation_tables(static_cast<std::uint8_t>(q));
    for (std::size_t i = 0; i < 64; ++i) {
      ASSERT_EQ(tables.luminance[i], encoder.quant_tbl_ptrs[0]->quantval[i]) << q << " " << i;
      ASSERT_EQ(tables.chrominance[i], encoder.quant_tbl_ptrs[1]->quantval[i]) << q << " " << i;
    }
  }
  for (const vexa::HuffmanTable& table : vexa::kHuffmanTables) {
    const auto number = static_cast<std::size_t>(table.destination & 0x0f);
    const JHUFF_TBL* reference =
        table.destination < 0x10 ? encoder.dc_huff_tbl_ptrs[number] : encoder.ac_huff_tbl_ptrs[number];
    EXPECT_TRUE(std::equal(table.code_counts.begin(), table.code_counts.end(), reference->bits + 1));
    EXPECT_TRUE(std::equal(table.symbols.begin(), table.symbols.end(), reference->huffval));
  }
  jpeg_destroy_compress(&encoder);
}

}  // namespace
}  // namespace vexa_test
