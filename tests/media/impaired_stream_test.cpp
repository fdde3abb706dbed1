// Streams of which packets are lost, sent twice or out of order.
#include <gtest/gtest.h>

#include <chrono>
#include <cstdint>
#include <iterator>
#include <map>
#include <string>
#include <thread>
#include <vector>

#include "tests/media/live_camera.h"
#include "tests/media/statistics_equations.h"

namespace vexa_test {
namespace {

/// What must arrive of the stream that the camera logged: a picture whose packets all left, behind a key picture
/// without a gap.
std::vector<std::uint64_t> predicted(const LiveCamera& camera, const std::vector<vexa::camera::SentPacket>& sent) {
  std::map<std::uint64_t, std::size_t> left;
  std::map<std::uint64_t, std::size_t> packets;
  for (const vexa::camera::SentPacket& packet : sent) {
    packets[packet.picture] = packet.picture_packets;
    if (!packet.lost && !packet.duplicate) ++left[packet.picture];
  }
  std::vector<std::uint64_t> delivered;
  bool chain = false;
  for (const auto& [picture, count] : packets) {
    chain = left[picture] == count && (chain || camera.is_key(picture));
    if (chain) delivered.push_back(picture);
  }
  return delivered;
}

/// The frames of a stream that ends by itself, `wanted` by now at the latest; one more when there is one too many.
std::vector<TakenFrame> take_whole_stream(LiveCamera& camera, MediaDriver& driver, std::vector<std::uint64_t>& wanted) {
  FrameTaker host;
  std::vector<TakenFrame> frames;
  const auto take_more = [&](std::size_t count, std::chrono::milliseconds patience) {
    const auto more = host.take_all(driver, count, patience);
    frames.insert(frames.end(), more.begin(), more.end());
    expect_equations(statistics_of(driver));
  };
  while (camera->sent().finished_streams() == 0) take_more(frames.max_size(), std::chrono::milliseconds(50));
  wanted = predicted(camera, camera->sent().snapshot());
  if (frames.size() < wanted.size()) take_more(wanted.size() - frames.size(), std::chrono::seconds(10));
  take_more(1, std::chrono::milliseconds(300));  // longer than a picture is ever held back
  return frames;
}

struct Impairment {
  const char* name;
  double loss = 0;
  double reorder = 0;
  double duplicate = 0;
  std::uint32_t start_timestamp = 0;
};

constexpr Impairment kImpairments[] = {
    {.name = "LossPermille1", .loss = 0.001, .start_timestamp = 100000000},
    {.name = "Loss1", .loss = 0.01, .start_timestamp = 4294000000},
    {.name = "Loss5", .loss = 0.05, .start_timestamp = 9000000},
    {.name = "Loss10", .loss = 0.1, .start_timestamp = 100000000},
    {.name = "Reorder5", .reorder = 0.05, .start_timestamp = 4294000000},
    {.name = "Reorder5AtTheLift", .reorder = 0.05, .start_timestamp = 9000000},
    {.name = "Duplicate1", .duplicate = 0.01, .start_timestamp = 4294000000},
    {.name = "All", .loss = 0.01, .reorder = 0.05, .duplicate = 0.01, .start_timestamp = 4294000000}};

using WholeFrames = std::vector<std::string>;

/// One of the streams of a test; `index` gives it a camera of its own.
struct ImpairedStream {
  unsigned index = 0;
  std::string clip;
  std::size_t max_payload = 600;
  /// All frames of the stream, which ends by itself.
  WholeFrames (*take)(LiveCamera& camera, MediaDriver& driver);
};

/// As a host takes them, through the streaming thread and the frame queue.
WholeFrames take_from_queue(LiveCamera& camera, MediaDriver& driver) {
  EXPECT_EQ(driver.StartVideoStreaming(), LIBD_OK);
  std::vector<std::uint64_t> wanted;
  WholeFrames frames;
  for (TakenFrame& frame : take_whole_stream(camera, driver, wanted)) frames.push_back(std::move(frame.bytes));
  return frames;
}

/// Without the frame queue, which drops JPEG pictures of a host that is slow for a moment.
WholeFrames take_from_assembly(LiveCamera& camera, MediaDriver& driver) {
  driver.use(camera->address(), camera->http_port(), 20000);
  EXPECT_EQ(driver.state().open_live_rtp(1), LIBD_OK);
  driver.use(camera->address(), camera->http_port(), 500);  // of a read: longer than a picture is ever held back
  std::vector<unsigned char> buffer(1200000);
  WholeFrames frames;
  const auto read = [&] {
    CVexaCommon::VideoFrameInfo frame;
    frame.data = buffer.data();
    frame.capacity = static_cast<unsigned int>(buffer.size());
    const ELibDReturnCode code = driver.GetRtpCurrentVideoFrame(driver.state().stream_codec(), frame);
    expect_equations(statistics_of(driver));
    if (code == LIBD_OK) frames.emplace_back(buffer.begin(), buffer.begin() + frame.length);
    return code;
  };
  while (camera->sent().finished_streams() == 0) read();
  const std::size_t wanted = predicted(camera, camera->sent().snapshot()).size();
  const auto end = std::chrono::steady_clock::now() + std::chrono::seconds(20);
  while (frames.size() < wanted && std::chrono::steady_clock::now() < end) read();
  read();  // one more when there is one too many
  return frames;
}

class Impaired : public testing::TestWithParam<Impairment> {
 protected:
  static void expect_whole_pictures(const ImpairedStream& stream) {
    auto options = camera_options(stream.index);
    options.clip_path = std::string(VEXA_CLIPS) + "/" + stream.clip;
    options.pictures = 400;
    if (stream.take == take_from_assembly) {
      options.speed = kJpegPace;
      options.pictures = 250;
    }
    options.seed = 42 + stream.index;
    options.max_payload = stream.max_payload;
    options.start_sequence = 65000;
    options.start_timestamp = GetParam().start_timestamp;
    options.packet_faults.loss = GetParam().loss;
    options.packet_faults.reorder = GetParam().reorder;
    options.packet_faults.duplicate = GetParam().duplicate;
    options.packet_faults.duplicate_distance = 20;
    LiveCamera camera(options);
    MediaDriver driver;
    camera.introduce(driver);
    const WholeFrames frames = stream.take(camera, driver);
    const vexa::StreamStatistics counted = statistics_of(driver);
    expect_equations(counted);
    EXPECT_EQ(counted.packetsReceived + counted.packetsDroppedByKernel, camera->sent().sent());
    EXPECT_EQ(counted.framesHandedOut + counted.framesHeldInQueue, frames.size());
    const std::vector<std::uint64_t> wanted = predicted(camera, camera->sent().snapshot());
    ASSERT_EQ(frames.size(), wanted.size()) << stream.clip << " " << stream.index;
    for (std::size_t i = 0; i < frames.size(); ++i) {
      ASSERT_TRUE(camera.sent(wanted[i], frames[i])) << stream.clip << " " << stream.index << ", frame " << i;
    }
  }

  static void expect_whole_pictures(const std::vector<ImpairedStream>& streams) {
    std::vector<std::thread> hosts;
    for (const ImpairedStream& stream : streams) hosts.emplace_back([&stream] { expect_whole_pictures(stream); });
    for (std::thread& host : hosts) host.join();
  }
};

TEST_P(Impaired, H264DeliversEveryWholePictureOnceInOrderAndNoDamagedOne) {
  std::vector<ImpairedStream> streams;
  for (unsigned index = 0; index < 5; ++index) streams.push_back({index, "small.h264", 600, take_from_queue});
  expect_whole_pictures(streams);
}

TEST_P(Impaired, OtherCodecsDeliverEveryWholePictureOnceInOrderAndNoDamagedOne) {
  expect_whole_pictures(std::vector<ImpairedStream>{{0, "small.m4v", 900, take_from_assembly},
                                                    {1, "plain.mjpeg", 900, take_from_assembly},
                                                    {2, "sliced.mjpeg", 900, take_from_assembly}});
}

/// A row plays its streams as slowly as in life where the address sanitizer leaves hosts little time, which is half a
/// minute a row: there the worst loss and the mixture run, which take every path of the assembly. The native build runs
/// all.
std::vector<Impairment> impairments_to_run() {
#if defined(__SANITIZE_ADDRESS__)
  return {kImpairments[3], kImpairments[7]};
#else
  return {std::begin(kImpairments), std::end(kImpairments)};
#endif
}

INSTANTIATE_TEST_SUITE_P(All, Impaired, testing::ValuesIn(impairments_to_run()),
                         [](const auto& tested) { return tested.param.name; });

}  // namespace
}  // namespace vexa_test
