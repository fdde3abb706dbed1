// SPDX-License-Identifier: Apache-2.0
#include "host/picture/picture_decoder.h"

#include <fmt/format.h>

#ifdef VEXA_WITH_FFMPEG
#include <optional>

#include "host/picture/ffmpeg_handles.h"
#endif

namespace vexa::host {

bool has_ffmpeg() {
#ifdef VEXA_WITH_FFMPEG
  return true;
#else
  return false;
#endif
}

Problem without_ffmpeg(const std::string& what) {
  return {ExitCode::kUsage, fmt::format("this vexactl was built without FFmpeg's libraries; {} needs them", what),
          "Use a build that has them, or record the video and decode it with ffmpeg."};
}

#ifndef VEXA_WITH_FFMPEG

Result<Picture> decode_picture(Codec codec, const std::vector<FrameBytes>&) {
  return fail(without_ffmpeg(fmt::format("decoding {}", name_of(codec))));
}

Result<StreamParameters> read_stream_parameters(Codec codec, const FrameBytes&) {
  return fail(without_ffmpeg(fmt::format("decoding {}", name_of(codec))));
}

#else

namespace {

// Above the largest cameras; a stream that claims more is refused before memory is taken for it.
constexpr std::int64_t kMostPixels = 64LL * 1024 * 1024;

constexpr double kFastest = 1000;  // pictures a second; a timing above it is not taken for one

Problem undecodable(Codec codec, const std::string& why) {
  return {ExitCode::kNoVideo, fmt::format("the camera's {} picture cannot be decoded: {}", name_of(codec), why),
          "Try again; if it persists, record the stream and examine it with ffprobe."};
}

FfmpegHandle<AVCodecContext> open_decoder(Codec codec) {
  const AVCodec* decoder = avcodec_find_decoder(ffmpeg_id(codec));
  if (decoder == nullptr) return nullptr;
  FfmpegHandle<AVCodecContext> context(avcodec_alloc_context3(decoder));
  if (!context) return nullptr;
  context->thread_count = 1;
  context->max_pixels = kMostPixels;
  if (avcodec_open2(context.get(), decoder, nullptr) < 0) return nullptr;
  return context;
}

// Keeps the last picture of those that are ready.
void take_pictures(AVCodecContext& decoder, FfmpegHandle<AVFrame>& last) {
  for (FfmpegHandle<AVFrame> frame(av_frame_alloc()); frame && avcodec_receive_frame(&decoder, frame.get()) == 0;) {
    last = std::move(frame);
    frame.reset(av_frame_alloc());
  }
}

int feed(AVCodecContext& decoder, const FrameBytes& bytes) {
  const FfmpegHandle<AVPacket> packet = packet_of(bytes.data(), bytes.size());
  return packet ? avcodec_send_packet(&decoder, packet.get()) : AVERROR(ENOMEM);
}

std::optional<Picture> to_rgb(const AVFrame& frame) {
  const FfmpegHandle<SwsContext> scaler(
      sws_getContext(frame.width, frame.height, static_cast<AVPixelFormat>(frame.format), frame.width, frame.height,
                     AV_PIX_FMT_RGB24, SWS_BILINEAR, nullptr, nullptr, nullptr));
  if (!scaler) return std::nullopt;
  Picture picture{frame.width, frame.height, {}};
  picture.rgb.resize(std::size_t{3} * static_cast<std::size_t>(frame.width) * static_cast<std::size_t>(frame.height));
  std::uint8_t* const planes[] = {picture.rgb.data()};
  const int strides[] = {3 * frame.width};
  if (sws_scale(scaler.get(), frame.data, frame.linesize, 0, frame.height, planes, strides) != frame.height) {
    return std::nullopt;
  }
  return picture;
}

double stated_rate(const AVCodecContext& decoder) {
  if (decoder.codec_id != AV_CODEC_ID_H264 || decoder.framerate.num <= 0 || decoder.framerate.den <= 0) return 0;
  const double rate = av_q2d(decoder.framerate);
  return rate <= kFastest ? rate : 0;
}

// The last of the frames' pictures, and the decoder that made it.
struct Decoded {
  FfmpegHandle<AVCodecContext> decoder;
  FfmpegHandle<AVFrame> picture;
};

Result<Decoded> decode(Codec codec, const std::vector<FrameBytes>& frames) {
  av_log_set_level(AV_LOG_QUIET);  // failures are reported in this program's words
  Decoded decoded{open_decoder(codec), nullptr};
  if (!decoded.decoder) return fail(undecodable(codec, "there is no decoder for it"));
  int error = 0;
  for (const FrameBytes& frame : frames) {
    if (const int fed = feed(*decoded.decoder, frame); fed < 0) error = fed;
    take_pictures(*decoded.decoder, decoded.picture);
  }
  avcodec_send_packet(decoded.decoder.get(), nullptr);  // what still waits for later pictures comes out
  take_pictures(*decoded.decoder, decoded.picture);
  if (decoded.picture) return decoded;
  return fail(undecodable(codec, error < 0 ? ffmpeg_error_text(error) : "it holds no picture"));
}

}  // namespace

Result<Picture> decode_picture(Codec codec, const std::vector<FrameBytes>& frames) {
  const Result<Decoded> decoded = decode(codec, frames);
  if (!decoded) return fail(decoded.error());
  if (auto picture = to_rgb(*decoded->picture)) return *std::move(picture);
  return fail(undecodable(codec, "its pixels cannot be converted"));
}

Result<StreamParameters> read_stream_parameters(Codec codec, const FrameBytes& key_frame) {
  const Result<Decoded> decoded = decode(codec, {key_frame});
  if (!decoded) return fail(decoded.error());
  return StreamParameters{decoded->picture->width, decoded->picture->height, stated_rate(*decoded->decoder)};
}

#endif

}  // namespace vexa::host
