#include "host/picture/picture_decoder.h"

#include <fmt/format.h>

#include "host/base/printable.h"

#ifdef VEXA_WITH_FFMPEG
#include <algorithm>
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
          "Use one that was built with them, or record the video and let ffmpeg do it."};
}

#ifndef VEXA_WITH_FFMPEG

Result<Picture> decode_picture(const std::string& codec, const std::vector<FrameBytes>&) {
  return fail(without_ffmpeg(fmt::format("decoding {}", printable(codec))));
}

#else

namespace {

// Above the largest cameras; a stream that claims more is refused before memory is taken for it.
constexpr std::int64_t kMostPixels = 64LL * 1024 * 1024;

AVCodecID decoder_id(const std::string& codec) {
  if (codec == "JPEG") return AV_CODEC_ID_MJPEG;
  if (codec == "MPEG4") return AV_CODEC_ID_MPEG4;
  if (codec == "H.264") return AV_CODEC_ID_H264;
  return AV_CODEC_ID_NONE;
}

Problem undecodable(const std::string& codec, const std::string& why) {
  return {ExitCode::kNoVideo, fmt::format("the camera's {} picture cannot be decoded: {}", printable(codec), why),
          "Try again; if it stays, record the stream and look at it with ffprobe."};
}

FfmpegHandle<AVCodecContext> open_decoder(const std::string& codec) {
  const AVCodec* decoder = avcodec_find_decoder(decoder_id(codec));
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
  const FfmpegHandle<AVPacket> packet(av_packet_alloc());
  if (!packet || av_new_packet(packet.get(), static_cast<int>(bytes.size())) < 0) return AVERROR(ENOMEM);
  std::copy(bytes.begin(), bytes.end(), packet->data);
  return avcodec_send_packet(&decoder, packet.get());
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

}  // namespace

Result<Picture> decode_picture(const std::string& codec, const std::vector<FrameBytes>& frames) {
  av_log_set_level(AV_LOG_QUIET);  // failures are told here, in this program's words
  const FfmpegHandle<AVCodecContext> decoder = open_decoder(codec);
  if (!decoder) return fail(undecodable(codec, "there is no decoder for it"));
  FfmpegHandle<AVFrame> last;
  int error = 0;
  for (const FrameBytes& frame : frames) {
    if (const int fed = feed(*decoder, frame); fed < 0) error = fed;
    take_pictures(*decoder, last);
  }
  avcodec_send_packet(decoder.get(), nullptr);  // what still waits for later pictures comes out
  take_pictures(*decoder, last);
  if (!last) return fail(undecodable(codec, error < 0 ? ffmpeg_error_text(error) : "it holds no picture"));
  if (auto picture = to_rgb(*last)) return *std::move(picture);
  return fail(undecodable(codec, "its pixels cannot be converted"));
}

#endif

}  // namespace vexa::host
