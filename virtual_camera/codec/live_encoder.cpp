// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/codec/live_encoder.h"

#include <utility>

#ifdef VEXA_WITH_FFMPEG
extern "C" {
#include <libavcodec/avcodec.h>
#include <libavutil/error.h>
#include <libavutil/frame.h>
#include <libavutil/log.h>
#include <libavutil/opt.h>
}

#include <algorithm>
#include <cstddef>
#include <cstring>
#include <span>
#endif

namespace vexa::camera {

#ifdef VEXA_WITH_FFMPEG
namespace {

std::string encoder_trouble(const char* doing, int code) {
  char text[AV_ERROR_MAX_STRING_SIZE] = {};
  av_strerror(code, text, sizeof text);
  return std::string(doing) + ": " + text;
}

const AVCodec* encoder_of(Codec codec) {
  switch (codec) {
    case Codec::kJpeg:
      return avcodec_find_encoder(AV_CODEC_ID_MJPEG);
    case Codec::kMpeg4:
      return avcodec_find_encoder(AV_CODEC_ID_MPEG4);
    case Codec::kH264:
      return avcodec_find_encoder_by_name("libx264");
  }
  return nullptr;
}

// The camera's 10 is a quantiser of 2, its 1 one of 20.
int jpeg_quantiser(int quality) { return 22 - 2 * std::clamp(quality, 1, 10); }

// Standard Huffman tables, and both quantisation tables even where they are alike: what RTP can carry.
void set_up_jpeg(AVCodecContext& context, const LiveEncoding& encoding) {
  context.color_range = AVCOL_RANGE_JPEG;
  context.flags |= AV_CODEC_FLAG_QSCALE;
  context.global_quality = jpeg_quantiser(encoding.quality) * FF_QP2LAMBDA;
  av_opt_set(context.priv_data, "huffman", "default", 0);
  av_opt_set(context.priv_data, "force_duplicated_matrix", "1", 0);
}

void set_up_motion(AVCodecContext& context, const LiveEncoding& encoding) {
  context.bit_rate = std::int64_t{std::max(encoding.bit_rate, 1)} * 1000;
  context.gop_size = encoding.key_interval > 0 ? encoding.key_interval : encoding.frame_rate;
  context.max_b_frames = 0;
  if (encoding.codec == Codec::kMpeg4) return;
  context.rc_max_rate = context.bit_rate;
  context.rc_buffer_size = static_cast<int>(std::min<std::int64_t>(context.bit_rate, 1000000000));
  av_opt_set(context.priv_data, "preset", "ultrafast", 0);
  av_opt_set(context.priv_data, "tune", "zerolatency", 0);
  av_opt_set(context.priv_data, "forced-idr", "1", 0);
}

void set_up(AVCodecContext& context, const LiveEncoding& encoding) {
  context.width = encoding.width;
  context.height = encoding.height;
  context.pix_fmt = AV_PIX_FMT_YUV420P;
  context.time_base = {1, encoding.frame_rate};
  context.framerate = {encoding.frame_rate, 1};
  context.thread_count = 1;
  context.flags |= AV_CODEC_FLAG_BITEXACT;  // no name of the encoder in what it writes
  if (encoding.codec == Codec::kJpeg) {
    set_up_jpeg(context, encoding);
  } else {
    set_up_motion(context, encoding);
  }
}

struct StartCode {
  std::size_t at = 0;    // of its first byte
  std::size_t unit = 0;  // of the byte after it; both are the end of the bytes when there is none
};

StartCode next_start_code(std::span<const std::uint8_t> bytes, std::size_t from) {
  for (std::size_t i = from; i + 3 <= bytes.size(); ++i) {
    if (bytes[i] == 0 && bytes[i + 1] == 0 && bytes[i + 2] == 1)
      return {i > from && bytes[i - 1] == 0 ? i - 1 : i, i + 3};
  }
  return {bytes.size(), bytes.size()};
}

// Without supplemental units, in which the encoder describes itself, and with start codes of four bytes.
std::vector<std::uint8_t> plain_h264(std::span<const std::uint8_t> bytes) {
  constexpr std::uint8_t kSupplemental = 6;
  std::vector<std::uint8_t> plain;
  for (StartCode code = next_start_code(bytes, 0); code.unit < bytes.size();) {
    const StartCode next = next_start_code(bytes, code.unit);
    if ((bytes[code.unit] & 0x1F) != kSupplemental) {
      plain.insert(plain.end(), {0, 0, 0, 1});
      const auto unit = bytes.subspan(code.unit, next.at - code.unit);
      plain.insert(plain.end(), unit.begin(), unit.end());
    }
    code = next;
  }
  return plain;
}

void copy_plane(const std::uint8_t* from, int width, int height, std::uint8_t* to, int pitch) {
  for (int row = 0; row < height; ++row, from += width, to += pitch) {
    std::memcpy(to, from, static_cast<std::size_t>(width));
  }
}

}  // namespace

struct LiveEncoder::Parts {
  struct Free {
    void operator()(AVCodecContext* freed) const { avcodec_free_context(&freed); }
    void operator()(AVFrame* freed) const { av_frame_free(&freed); }
    void operator()(AVPacket* freed) const { av_packet_free(&freed); }
  };

  Codec codec = Codec::kH264;
  std::unique_ptr<AVCodecContext, Free> context;
  std::unique_ptr<AVFrame, Free> frame;
  std::unique_ptr<AVPacket, Free> packet;
  std::int64_t next = 0;  // picture
  bool key_wanted = false;

  [[nodiscard]] int take(const I420Picture& picture);
};

bool has_live_encoders() { return true; }

std::variant<LiveEncoder, std::string> LiveEncoder::open(const LiveEncoding& encoding) {
  if (encoding.width < 2 || encoding.height < 2 || encoding.width % 2 != 0 || encoding.height % 2 != 0) {
    return "sides of a picture are even and at least 2";
  }
  if (encoding.frame_rate < 1) return "at least one picture a second";
  av_log_set_level(AV_LOG_QUIET);  // the library's own lines would mix with the program's
  const AVCodec* codec = encoder_of(encoding.codec);
  if (codec == nullptr) return "FFmpeg's libraries here lack the encoder";
  auto parts = std::make_unique<Parts>();
  parts->codec = encoding.codec;
  parts->context.reset(avcodec_alloc_context3(codec));
  parts->frame.reset(av_frame_alloc());
  parts->packet.reset(av_packet_alloc());
  if (!parts->context || !parts->frame || !parts->packet) return "no memory for an encoder";
  AVCodecContext& context = *parts->context;
  set_up(context, encoding);
  if (const int failed = avcodec_open2(&context, codec, nullptr); failed < 0)
    return encoder_trouble("open the encoder", failed);
  AVFrame& frame = *parts->frame;
  frame.format = context.pix_fmt;
  frame.width = context.width;
  frame.height = context.height;
  frame.color_range = context.color_range;
  frame.quality = context.global_quality;
  if (const int failed = av_frame_get_buffer(&frame, 0); failed < 0) return encoder_trouble("make a picture", failed);
  return LiveEncoder(std::move(parts));
}

int LiveEncoder::Parts::take(const I420Picture& picture) {
  if (const int failed = av_frame_make_writable(frame.get()); failed < 0) return failed;
  const int width = picture.width();
  const int height = picture.height();
  copy_plane(picture.y(), width, height, frame->data[0], frame->linesize[0]);
  copy_plane(picture.u(), width / 2, height / 2, frame->data[1], frame->linesize[1]);
  copy_plane(picture.v(), width / 2, height / 2, frame->data[2], frame->linesize[2]);
  frame->pts = next++;
  frame->pict_type = std::exchange(key_wanted, false) ? AV_PICTURE_TYPE_I : AV_PICTURE_TYPE_NONE;
  if (const int failed = avcodec_send_frame(context.get(), frame.get()); failed < 0) return failed;
  av_packet_unref(packet.get());
  return avcodec_receive_packet(context.get(), packet.get());
}

std::variant<EncodedPicture, std::string> LiveEncoder::encode(const I420Picture& picture) {
  if (picture.width() != parts_->context->width || picture.height() != parts_->context->height) {
    return "a picture of another size";
  }
  if (const int failed = parts_->take(picture); failed < 0) return encoder_trouble("encode a picture", failed);
  const AVPacket& packet = *parts_->packet;
  const std::span<const std::uint8_t> bytes(packet.data, static_cast<std::size_t>(packet.size));
  EncodedPicture encoded;
  encoded.key = (packet.flags & AV_PKT_FLAG_KEY) != 0;
  if (parts_->codec == Codec::kH264) {
    encoded.bytes = plain_h264(bytes);
  } else {
    encoded.bytes.assign(bytes.begin(), bytes.end());
  }
  return encoded;
}

void LiveEncoder::ask_for_key() { parts_->key_wanted = true; }

#else

struct LiveEncoder::Parts {};

bool has_live_encoders() { return false; }

std::variant<LiveEncoder, std::string> LiveEncoder::open(const LiveEncoding&) {
  return "this build is without FFmpeg's libraries";
}

// No encoder is ever made here.
std::variant<EncodedPicture, std::string> LiveEncoder::encode(const I420Picture&) {
  return "this build is without FFmpeg's libraries";
}

void LiveEncoder::ask_for_key() {}

#endif

LiveEncoder::LiveEncoder(std::unique_ptr<Parts> parts) : parts_(std::move(parts)) {}
LiveEncoder::LiveEncoder(LiveEncoder&&) noexcept = default;
LiveEncoder& LiveEncoder::operator=(LiveEncoder&&) noexcept = default;
LiveEncoder::~LiveEncoder() = default;

}  // namespace vexa::camera
