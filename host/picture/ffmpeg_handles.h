// SPDX-License-Identifier: Apache-2.0
// FFmpeg's objects, each freed with its handle.
#ifndef HOST_PICTURE_FFMPEG_HANDLES_H_
#define HOST_PICTURE_FFMPEG_HANDLES_H_

#include <cstddef>
#include <cstdint>
#include <cstring>
#include <limits>
#include <memory>
#include <string>

#include "host/base/codec.h"

extern "C" {
#include <libavcodec/avcodec.h>
#include <libavcodec/bsf.h>
#include <libavutil/error.h>
#include <libavutil/frame.h>
#include <libavutil/imgutils.h>
#include <libswscale/swscale.h>
}

namespace vexa::host {

struct FfmpegDeleter {
  void operator()(AVCodecContext* context) const { avcodec_free_context(&context); }
  void operator()(AVFrame* frame) const { av_frame_free(&frame); }
  void operator()(AVPacket* packet) const { av_packet_free(&packet); }
  void operator()(SwsContext* scaler) const { sws_freeContext(scaler); }
  void operator()(AVBSFContext* filter) const { av_bsf_free(&filter); }
};

template <typename Object>
using FfmpegHandle = std::unique_ptr<Object, FfmpegDeleter>;

[[nodiscard]] inline AVCodecID ffmpeg_id(Codec codec) {
  switch (codec) {
    case Codec::kJpeg:
      return AV_CODEC_ID_MJPEG;
    case Codec::kMpeg4:
      return AV_CODEC_ID_MPEG4;
    case Codec::kH264:
      return AV_CODEC_ID_H264;
  }
  return AV_CODEC_ID_NONE;
}

// A copy of the bytes; null when it does not fit into memory or a packet.
[[nodiscard]] inline FfmpegHandle<AVPacket> packet_of(const std::uint8_t* bytes, std::size_t length) {
  if (length > static_cast<std::size_t>(std::numeric_limits<int>::max() - AV_INPUT_BUFFER_PADDING_SIZE)) return nullptr;
  FfmpegHandle<AVPacket> packet(av_packet_alloc());
  if (!packet || av_new_packet(packet.get(), static_cast<int>(length)) < 0) return nullptr;
  if (length > 0) std::memcpy(packet->data, bytes, length);
  return packet;
}

[[nodiscard]] inline std::string ffmpeg_error_text(int error) {
  char text[AV_ERROR_MAX_STRING_SIZE] = "";
  av_strerror(error, text, sizeof text);
  return text;
}

}  // namespace vexa::host

#endif  // HOST_PICTURE_FFMPEG_HANDLES_H_
