// The driver, and a host that waits for the frames of all streams in one thread.
#include "bench/peers/peer.h"
#include "vexa/vexa_common.h"
#include "vexa/waiting.h"

namespace vexa_peers {
namespace {

class TakingSink : public CDataSink {
 public:
  void Write(const unsigned char* data, unsigned int length) override { received.take(data, length); }
  Received received;
};

const char* codec_name(const std::string& codec) {
  if (codec == "jpeg") return "JPEG";
  return codec == "mpeg4" ? "MPEG4" : "H.264";
}

class DriverPeer : public Peer {
 public:
  explicit DriverPeer(const Options& options) : options_(options) {}

  bool start() override {
    for (std::size_t i = 0; i < options_.streams; ++i) {
      drivers_.push_back(std::make_unique<CVexaCommon>());
      CVexaCommon& driver = *drivers_.back();
      SLibDConnectionInfo connection;
      connection.streamTransport = 1;
      connection.host = kAddress;
      connection.port = kHttpPort;
      connection.timeout = 5000;
      connection.userName = connection.password = "admin";
      driver.SetCGILogPath("/dev/null");  // the next call opens it
      driver.SetCurrentConnectionInfo(connection);
      SLibDCameraInfo camera;
      camera.codecName = codec_name(options_.codec);
      driver.SetCameraInfo(camera);
      vexa::SetPromptFrames(driver, options_.prompt);
      if (driver.StartVideoStreaming() != LIBD_OK) return false;
    }
    return true;
  }

  Received run() override {
    const std::uint64_t wanted = options_.pictures() * options_.streams;
    vexa::WaitSet streams;
    for (const auto& driver : drivers_) streams.Add(*driver);
    TakingSink sink;
    sink.received.delays.reserve(static_cast<std::size_t>(wanted));
    std::vector<vexa::ReadyDriver> ready;
    for (std::uint64_t frames = 0; frames < wanted && streams.Wait(ready, kSilence) > 0;) {
      for (const vexa::ReadyDriver& one : ready) {
        SLibDVideoFrameInfo frame;
        frame.sink = &sink;
        while (one.driver->GetCurrentVideoFrame(frame) == LIBD_OK) ++frames;
      }
    }
    return sink.received;
  }

  void stop() override {
    for (const auto& driver : drivers_) driver->StopVideoStreaming();
  }

 private:
  const Options options_;
  std::vector<std::unique_ptr<CVexaCommon>> drivers_;
};

}  // namespace

std::unique_ptr<Peer> make_driver_peer(const Options& options) { return std::make_unique<DriverPeer>(options); }

}  // namespace vexa_peers
