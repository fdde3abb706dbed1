// SPDX-License-Identifier: Apache-2.0
#include "host/picture/picture_file.h"

#include "host/base/file_extension.h"
#include "host/picture/picture_decoder.h"

#ifdef VEXA_WITH_FFMPEG
#include "host/picture/ffmpeg_handles.h"
#endif

namespace vexa::host {
namespace {

struct Extension {
  std::string_view text;
  PictureFormat format;
};

constexpr Extension kExtensions[] = {
    {".png", PictureFormat::kPng}, {".jpg", PictureFormat::kJpeg}, {".jpeg", PictureFormat::kJpeg}};

}  // namespace

std::optional<PictureFormat> picture_format_of(std::string_view file) {
  for (const Extension& extension : kExtensions) {
    if (has_extension(file, extension.text)) return extension.format;
  }
  return std::nullopt;
}

bool makes_jpeg_of(Codec codec) { return codec == Codec::kJpeg || has_ffmpeg(); }

Result<std::vector<std::uint8_t>> jpeg_of(Codec codec, const std::vector<FrameBytes>& frames) {
  if (codec == Codec::kJpeg && !frames.empty()) return frames.back();
  const Result<Picture> picture = decode_picture(codec, frames);
  if (!picture) return fail(picture.error());
  return encode_picture(*picture, PictureFormat::kJpeg);
}

#ifndef VEXA_WITH_FFMPEG

Result<std::vector<std::uint8_t>> encode_picture(const Picture&, PictureFormat) {
  return fail(without_ffmpeg("writing a picture"));
}

#else

namespace {

constexpr int kBestJpegQuality = 2;  // of FFmpeg's scale from 2 to 31

Problem unencodable(const std::string& why) {
  return {ExitCode::kCannotWrite, "the picture cannot be encoded: " + why, "Choose the other of .png and .jpg."};
}

FfmpegHandle<AVCodecContext> open_encoder(const Picture& picture, PictureFormat format) {
  const bool png = format == PictureFormat::kPng;
  const AVCodec* encoder = avcodec_find_encoder(png ? AV_CODEC_ID_PNG : AV_CODEC_ID_MJPEG);
  if (encoder == nullptr) return nullptr;
  FfmpegHandle<AVCodecContext> context(avcodec_alloc_context3(encoder));
  if (!context) return nullptr;
  context->width = picture.width;
  context->height = picture.height;
  context->time_base = {1, 1};
  context->thread_count = 1;
  context->pix_fmt = png ? AV_PIX_FMT_RGB24 : AV_PIX_FMT_YUVJ444P;
  context->color_range = AVCOL_RANGE_JPEG;
  context->flags |= AV_CODEC_FLAG_QSCALE;
  context->global_quality = FF_QP2LAMBDA * kBestJpegQuality;
  if (avcodec_open2(context.get(), encoder, nullptr) < 0) return nullptr;
  return context;
}

FfmpegHandle<AVFrame> frame_of(const Picture& picture, const AVCodecContext& encoder) {
  FfmpegHandle<AVFrame> frame(av_frame_alloc());
  if (!frame) return nullptr;
  frame->width = picture.width;
  frame->height = picture.height;
  frame->format = encoder.pix_fmt;
  frame->quality = encoder.global_quality;
  if (av_frame_get_buffer(frame.get(), 0) < 0) return nullptr;
  const FfmpegHandle<SwsContext> scaler(sws_getContext(picture.width, picture.height, AV_PIX_FMT_RGB24, picture.width,
                                                       picture.height, encoder.pix_fmt, SWS_BILINEAR, nullptr, nullptr,
                                                       nullptr));
  if (!scaler) return nullptr;
  const std::uint8_t* const planes[] = {picture.rgb.data()};
  const int strides[] = {3 * picture.width};
  if (sws_scale(scaler.get(), planes, strides, 0, picture.height, frame->data, frame->linesize) != picture.height) {
    return nullptr;
  }
  return frame;
}

}  // namespace

Result<std::vector<std::uint8_t>> encode_picture(const Picture& picture, PictureFormat format) {
  av_log_set_level(AV_LOG_QUIET);
  const FfmpegHandle<AVCodecContext> encoder = open_encoder(picture, format);
  if (!encoder) return fail(unencodable("there is no encoder for its size"));
  const FfmpegHandle<AVFrame> frame = frame_of(picture, *encoder);
  const FfmpegHandle<AVPacket> packet(av_packet_alloc());
  if (!frame || !packet) return fail(unencodable("there is not enough memory"));
  int error = avcodec_send_frame(encoder.get(), frame.get());
  if (error == 0) error = avcodec_send_frame(encoder.get(), nullptr);
  if (error == 0) error = avcodec_receive_packet(encoder.get(), packet.get());
  if (error < 0) return fail(unencodable(ffmpeg_error_text(error)));
  return std::vector<std::uint8_t>(packet->data, packet->data + packet->size);
}

#endif

}  // namespace vexa::host
