// FFmpeg's objects, each freed with its handle.
#ifndef HOST_PICTURE_FFMPEG_HANDLES_H_
#define HOST_PICTURE_FFMPEG_HANDLES_H_

#include <memory>
#include <string>

extern "C" {
#include <libavcodec/avcodec.h>
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
};

template <typename Object>
using FfmpegHandle = std::unique_ptr<Object, FfmpegDeleter>;

[[nodiscard]] inline std::string ffmpeg_error_text(int error) {
  char text[AV_ERROR_MAX_STRING_SIZE] = "";
  av_strerror(error, text, sizeof text);
  return text;
}

}  // namespace vexa::host

#endif  // HOST_PICTURE_FFMPEG_HANDLES_H_
