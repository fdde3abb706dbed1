// SPDX-License-Identifier: Apache-2.0
// CPU seconds that a GB of RTP costs its reader: pictures of each codec, beside a loop that only receives.
//   rtp_codecs_e2e [MEGABYTES]
#include <sys/socket.h>
#include <time.h>
#include <unistd.h>

#include <algorithm>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <memory>
#include <string>
#include <thread>
#include <vector>

#include "device/driver_state.h"
#include "vexa/vexa_common.h"
#include "virtual_camera/rtp/rtp_stream.h"
#include "virtual_camera/values/options.h"

namespace {

using vexa::camera::PacketisedClip;

double cpu_seconds() {
  timespec now{};
  clock_gettime(CLOCK_THREAD_CPUTIME_ID, &now);
  return static_cast<double>(now.tv_sec) + static_cast<double>(now.tv_nsec) / 1e9;
}

/// The camera's end of a pair of datagram sockets, which holds the sender back when the reader is slower.
class Feed {
 public:
  Feed(std::shared_ptr<const PacketisedClip> clip, std::uint64_t bytes) : clip_(std::move(clip)), bytes_(bytes) {
    if (socketpair(AF_UNIX, SOCK_DGRAM | SOCK_CLOEXEC, 0, ends_) != 0) std::abort();
    sender_ = std::thread([this] { send_all(); });
  }
  Feed(const Feed&) = delete;
  Feed& operator=(const Feed&) = delete;
  ~Feed() {
    sender_.join();
    close(ends_[1]);
  }
  int reader() const { return ends_[1]; }
  std::uint64_t sent() const { return sent_; }

 private:
  void send_all() {
    vexa::camera::CameraOptions options;
    options.clip = clip_;
    vexa::camera::RtpStream stream(options, {}, 1, 1);
    std::vector<vexa::camera::Outgoing> packets;
    std::vector<std::uint8_t> datagram;
    while (sent_ < bytes_) {
      packets.clear();
      stream.take_picture(packets);
      for (const auto& packet : packets) {
        datagram.assign(packet.header.begin(), packet.header.end());
        const auto payload = packet.payload_to_send();
        datagram.insert(datagram.end(), payload.begin(), payload.end());
        if (send(ends_[0], datagram.data(), datagram.size(), 0) < 0) return;
        sent_ += datagram.size();
      }
    }
    close(ends_[0]);
  }

  std::shared_ptr<const PacketisedClip> clip_;
  std::uint64_t bytes_;
  std::uint64_t sent_ = 0;
  int ends_[2] = {-1, -1};
  std::thread sender_;
};

class Reader : public CVexaCommon {
 public:
  explicit Reader(int socket) {
    m_ConnectionInfo.timeout = 200;
    m_RtpClockRate = 90000;
    m_StreamSocket = socket;
    if (!m_State->allocate_packets()) std::abort();
  }
  ~Reader() override {
    m_StreamSocket = -1;
    ReleaseRtpPacketsPtr();
  }

  /// Reads pictures until none comes any more: their bytes.
  std::uint64_t read_all(const std::string& codec) {
    std::vector<unsigned char> buffer(1200000);
    VideoFrameInfo frame;
    frame.data = buffer.data();
    frame.capacity = static_cast<unsigned int>(buffer.size());
    std::uint64_t bytes = 0;
    while (GetRtpCurrentVideoFrame(codec, frame) == LIBD_OK) bytes += frame.length;
    return bytes;
  }
};

double receive_alone(const std::shared_ptr<const PacketisedClip>& clip, std::uint64_t bytes) {
  Feed feed(clip, bytes);
  std::vector<unsigned char> buffer(65536);
  std::uint64_t received = 0;
  const double begin = cpu_seconds();
  for (ssize_t length = 1; length > 0;) {
    length = recv(feed.reader(), buffer.data(), buffer.size(), 0);
    received += length > 0 ? static_cast<std::uint64_t>(length) : 0;
    if (received >= bytes && recv(feed.reader(), buffer.data(), 1, MSG_PEEK | MSG_DONTWAIT) <= 0) break;
  }
  return (cpu_seconds() - begin) / static_cast<double>(received) * 1e9;
}

double assemble(const std::shared_ptr<const PacketisedClip>& clip, const std::string& codec, std::uint64_t bytes) {
  Feed feed(clip, bytes);
  Reader reader(feed.reader());
  const double begin = cpu_seconds();
  const std::uint64_t read = reader.read_all(codec);
  const double taken = cpu_seconds() - begin;
  if (read < bytes * 8 / 10) std::printf("only %llu bytes of pictures\n", static_cast<unsigned long long>(read));
  return taken / static_cast<double>(bytes) * 1e9;
}

}  // namespace

int main(int argc, char** argv) {
  const std::uint64_t bytes = (argc > 1 ? std::strtoull(argv[1], nullptr, 10) : 256) << 20;
  const struct {
    const char* file;
    const char* codec;
  } clips[] = {{"/plain.mjpeg", "JPEG"}, {"/sliced.mjpeg", "JPEG"}, {"/small.m4v", "MPEG4"}, {"/low2m.h264", "H.264"}};
  for (const auto& row : clips) {
    const auto clip = PacketisedClip::load(std::string(VEXA_CLIPS) + row.file, 1400);
    if (!clip) return 1;
    const double alone = receive_alone(clip, bytes);
    const double whole = assemble(clip, row.codec, bytes);
    std::printf("%-14s receiving alone %.2f s/GB, pictures %.2f s/GB: %.2f times\n", row.file + 1, alone, whole,
                whole / alone);
  }
  return 0;
}
