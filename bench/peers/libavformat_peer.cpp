// FFmpeg's demultiplexer, a thread a stream, as programs use it that show or record cameras.
#include "bench/peers/peer.h"

#ifdef VEXA_WITH_FFMPEG
extern "C" {
#include <libavformat/avformat.h>
}

#include <string>
#include <thread>
#endif

namespace vexa_peers {

#ifdef VEXA_WITH_FFMPEG
namespace {

void read_packets(AVFormatContext* context, std::uint64_t pictures, Received& received) {
  AVPacket* packet = av_packet_alloc();
  while (received.frames < pictures && av_read_frame(context, packet) >= 0) {
    received.take(packet->data, static_cast<std::size_t>(packet->size));
    av_packet_unref(packet);
  }
  av_packet_free(&packet);
}

class LibavformatPeer : public Peer {
 public:
  explicit LibavformatPeer(const Options& options) : options_(options) { av_log_set_level(AV_LOG_QUIET); }

  bool start() override {
    const std::string url = "rtsp://" + std::string(kAddress) + "/media/video1";
    for (std::size_t i = 0; i < options_.streams; ++i) {
      AVDictionary* settings = nullptr;
      av_dict_set(&settings, "rtsp_transport", "udp", 0);
      av_dict_set(&settings, "timeout", "1500000", 0);  // microseconds
      av_dict_set(&settings, "buffer_size", "524288", 0);
      av_dict_set(&settings, "fflags", "noparse", 0);  // the pictures are made up
      AVFormatContext* context = nullptr;
      const int opened = avformat_open_input(&context, url.c_str(), nullptr, &settings);
      av_dict_free(&settings);
      if (opened < 0) return false;
      contexts_.push_back(context);
    }
    return true;
  }

  Received run() override {
    std::vector<Received> parts(contexts_.size());
    std::vector<std::thread> threads;
    for (std::size_t i = 0; i < contexts_.size(); ++i) {
      threads.emplace_back(read_packets, contexts_[i], options_.pictures(), std::ref(parts[i]));
    }
    for (std::thread& thread : threads) thread.join();
    Received received;
    for (const Received& part : parts) received.add(part);
    return received;
  }

  void stop() override {
    for (AVFormatContext* context : contexts_) avformat_close_input(&context);
  }

 private:
  const Options options_;
  std::vector<AVFormatContext*> contexts_;
};

}  // namespace

std::unique_ptr<Peer> make_libavformat_peer(const Options& options) {
  return std::make_unique<LibavformatPeer>(options);
}
#else
std::unique_ptr<Peer> make_libavformat_peer(const Options&) { return nullptr; }
#endif

}  // namespace vexa_peers
