// SPDX-License-Identifier: Apache-2.0
#include "host/recording/media_container.h"

#include <utility>
#include <vector>

#include "host/picture/picture_decoder.h"
#include "host/recording/frame_file.h"

#ifdef VEXA_WITH_FFMPEG
#include <fmt/format.h>

#include <algorithm>
#include <cstring>

#include "host/base/unique_fd.h"
#include "host/picture/ffmpeg_handles.h"

extern "C" {
#include <libavformat/avformat.h>
}
#endif

namespace vexa::host {

#ifndef VEXA_WITH_FFMPEG

class MediaContainer::Muxer {};

std::optional<Problem> MediaContainer::check() const { return without_ffmpeg("writing .mkv and .mp4"); }

std::optional<Problem> MediaContainer::write(const RecordedPicture&) { return check(); }

std::optional<Problem> MediaContainer::close() { return std::nullopt; }

#else

namespace {

constexpr AVRational kMicroseconds{1, 1000000};
constexpr int kPipeBuffer = 65536;

const char* muxer_name(ContainerFormat format) {
  switch (format) {
    case ContainerFormat::kMatroska:
      return "matroska";
    case ContainerFormat::kMp4:
      return "mp4";
  }
  return "";
}

Problem unwritten(const std::string& path, int error) {
  return {ExitCode::kCannotWrite, fmt::format("cannot write {}: {}", path, ffmpeg_error_text(error)),
          "Give --out a file in a folder that exists, that you may write to, and that has room."};
}

}  // namespace

class MediaContainer::Muxer {
 public:
  Muxer() = default;
  ~Muxer() {
    if (context_ == nullptr) return;
    (void)close_output();
    avformat_free_context(context_);
  }
  Muxer(const Muxer&) = delete;
  Muxer& operator=(const Muxer&) = delete;

  [[nodiscard]] std::optional<Problem> open(const MediaContainer& file, const RecordedPicture& first) {
    const Result<StreamParameters> video =
        read_stream_parameters(first.codec, FrameBytes(first.data, first.data + first.length));
    if (!video) return video.error();
    int result = avformat_alloc_output_context2(&context_, nullptr, muxer_name(file.format_), file.path_.c_str());
    if (result < 0) return unwritten(file.path_, result);
    stream_ = avformat_new_stream(context_, nullptr);
    if (stream_ == nullptr) return unwritten(file.path_, AVERROR(ENOMEM));
    stream_->codecpar->codec_type = AVMEDIA_TYPE_VIDEO;
    stream_->codecpar->codec_id = ffmpeg_id(first.codec);
    stream_->codecpar->width = video->width;
    stream_->codecpar->height = video->height;
    stream_->time_base = {1, 90000};  // MP4 takes it, Matroska has its own
    take_headers(first);
    context_->flags |= AVFMT_FLAG_FLUSH_PACKETS;
    result = open_output(file);
    if (result >= 0) result = write_header(file.format_);
    if (result < 0) return unwritten(file.path_, result);
    begun_ = true;
    return std::nullopt;
  }

  [[nodiscard]] int write(const RecordedPicture& picture) {
    const FfmpegHandle<AVPacket> packet = packet_of(picture.data, picture.length);
    if (!packet) return AVERROR(ENOMEM);
    packet->stream_index = stream_->index;
    const std::int64_t before = last_;
    packet->pts = packet->dts = place_of(picture.time);
    packet->duration = std::max<std::int64_t>(packet->pts - before, 1);  // a guess, which counts for the last one
    if (picture.key) packet->flags |= AV_PKT_FLAG_KEY;
    const int result = av_write_frame(context_, packet.get());
    return result < 0 ? result : context_->pb->error;
  }

  [[nodiscard]] int finish() {
    if (!std::exchange(begun_, false)) return 0;
    const int ended = av_write_trailer(context_);
    return std::min(ended, close_output());
  }

 private:
  // Named so that no part of the path is taken for a protocol. A pipe is written by our own function: FFmpeg's would
  // not wait where the pipe has been made non-blocking.
  [[nodiscard]] int open_output(const MediaContainer& file) {
    if (file.given_fd_ < 0) return avio_open(&context_->pb, ("file:" + file.path_).c_str(), AVIO_FLAG_WRITE);
    pipe_ = file.given_fd_;
    auto* buffer = static_cast<unsigned char*>(av_malloc(kPipeBuffer));
    if (buffer == nullptr) return AVERROR(ENOMEM);
    context_->pb = avio_alloc_context(buffer, kPipeBuffer, 1, &pipe_, nullptr, write_pipe, nullptr);
    if (context_->pb != nullptr) return 0;
    av_free(buffer);
    return AVERROR(ENOMEM);
  }

  static int write_pipe(void* pipe, std::uint8_t* data, int length) {
    const int error = write_all(*static_cast<const int*>(pipe), data, static_cast<std::size_t>(length));
    return error == 0 ? length : AVERROR(error);
  }

  [[nodiscard]] int close_output() {
    if (pipe_ < 0 || context_->pb == nullptr) return avio_closep(&context_->pb);
    avio_flush(context_->pb);
    const int error = context_->pb->error;
    av_freep(&context_->pb->buffer);
    avio_context_free(&context_->pb);
    return error;
  }

  // A second of video is what a program that is killed may lose.
  [[nodiscard]] int write_header(ContainerFormat format) {
    AVDictionary* options = nullptr;
    if (format == ContainerFormat::kMatroska) {
      av_dict_set(&options, "cluster_time_limit", "1000", 0);  // milliseconds
    } else {
      av_dict_set(&options, "movflags", "empty_moov+default_base_moof", 0);
      av_dict_set(&options, "frag_duration", "1000000", 0);  // microseconds
    }
    const int result = avformat_write_header(context_, &options);
    av_dict_free(&options);
    return result;
  }

  // What a container keeps of the first picture, to be read before any picture: H.264's parameter sets, MPEG-4's
  // headers. JPEG has none, and a stream without them is written as it is.
  void take_headers(const RecordedPicture& first) {
    AVBSFContext* made = nullptr;
    const AVBitStreamFilter* kind = av_bsf_get_by_name("extract_extradata");
    if (kind == nullptr || av_bsf_alloc(kind, &made) < 0) return;
    const FfmpegHandle<AVBSFContext> filter(made);
    const FfmpegHandle<AVPacket> packet = packet_of(first.data, first.length);
    if (!packet || avcodec_parameters_copy(filter->par_in, stream_->codecpar) < 0 || av_bsf_init(filter.get()) < 0 ||
        av_bsf_send_packet(filter.get(), packet.get()) < 0 || av_bsf_receive_packet(filter.get(), packet.get()) < 0) {
      return;
    }
    std::size_t size = 0;
    const std::uint8_t* headers = av_packet_get_side_data(packet.get(), AV_PKT_DATA_NEW_EXTRADATA, &size);
    if (headers != nullptr) keep_headers(headers, size);
  }

  void keep_headers(const std::uint8_t* headers, std::size_t size) {
    AVCodecParameters& parameters = *stream_->codecpar;
    parameters.extradata = static_cast<std::uint8_t*>(av_mallocz(size + AV_INPUT_BUFFER_PADDING_SIZE));
    if (parameters.extradata == nullptr) return;
    std::memcpy(parameters.extradata, headers, size);
    parameters.extradata_size = static_cast<int>(size);
  }

  // In the stream's units, after the previous picture.
  std::int64_t place_of(std::chrono::microseconds time) {
    if (!began_) began_ = time;
    const std::int64_t place = av_rescale_q((time - *began_).count(), kMicroseconds, stream_->time_base);
    last_ = std::max(place, last_ + 1);
    return last_;
  }

  AVFormatContext* context_ = nullptr;
  AVStream* stream_ = nullptr;  // the context's
  std::optional<std::chrono::microseconds> began_;
  std::int64_t last_ = -1;
  bool begun_ = false;  // the header is written
  int pipe_ = -1;       // what a pipe's pictures go to
};

std::optional<Problem> MediaContainer::check() const { return FrameFile(path_, given_fd_).check(); }

std::optional<Problem> MediaContainer::write(const RecordedPicture& picture) {
  if (!muxer_) {
    auto muxer = std::make_unique<Muxer>();
    if (auto problem = muxer->open(*this, picture)) return problem;
    muxer_ = std::move(muxer);
  }
  const int error = muxer_->write(picture);
  if (error < 0) return unwritten(path_, error);
  return std::nullopt;
}

std::optional<Problem> MediaContainer::close() {
  const int error = muxer_ ? muxer_->finish() : 0;
  if (error < 0) return unwritten(path_, error);
  return std::nullopt;
}

#endif

MediaContainer::MediaContainer(std::string path, ContainerFormat format)
    : MediaContainer(std::move(path), format, -1) {}

MediaContainer::MediaContainer(std::string name, ContainerFormat format, int open_fd)
    : path_(std::move(name)), format_(format), given_fd_(open_fd) {}

MediaContainer::~MediaContainer() = default;

}  // namespace vexa::host
