#include "virtual_camera/model/profile_video.h"

#include <algorithm>
#include <string>
#include <utility>
#include <vector>

namespace vexa::camera {
namespace {

constexpr std::size_t kMostRates = 32;
constexpr std::size_t kMostBitRates = 64;
constexpr std::size_t kMostCodecs = 3;
constexpr std::size_t kMostStreams = 4;
constexpr int kMostFrames = 60;
constexpr int kBestQuality = 100;
constexpr int kMostKilobits = 100000;

// The camera's word of what a profile names.
std::string codec_word(const ProfilePlace& place) {
  const std::string name = place.one_of({"JPEG", "MPEG4", "H.264"});
  if (name == "H.264") return "h264";
  return name == "MPEG4" ? "mpeg4" : "jpeg";
}

OfferedCodec codec_of(const ProfilePlace& place) {
  place.with_only({"name", "sizes", "frameRates", "qualities", "bitRates"});
  OfferedCodec codec;
  codec.word = codec_word(place.required("name"));
  codec.sizes = place.required("sizes").sizes();
  codec.frame_rates = place.required("frameRates").ascending(kMostRates, kMostFrames);
  const bool jpeg = codec.word == "jpeg";
  if (jpeg) codec.qualities = place.required("qualities").ascending(kMostRates, kBestQuality);
  if (!jpeg) codec.bit_rates = place.required("bitRates").ascending(kMostBitRates, kMostKilobits);
  place.forbid(jpeg ? "bitRates" : "qualities", jpeg ? "is not for JPEG" : "is for JPEG only");
  return codec;
}

template <typename Value>
Value offered(const ProfilePlace& place, const std::vector<Value>& offers, const Value& value) {
  const bool found = std::find(offers.begin(), offers.end(), value) != offers.end();
  if (!found) place.refuse("is not one of those that the codec offers");
  return value;
}

StreamDefaults stream_of(const ProfilePlace& place, const CameraProfile& profile) {
  place.with_only({"codec", "size", "frameRate", "quality", "bitRate"});
  StreamDefaults stream;
  stream.codec = codec_word(place.required("codec"));
  const OfferedCodec* codec = profile.codec(stream.codec);
  if (codec == nullptr) place.optional("codec").refuse("is not one of the camera's codecs");
  const ProfilePlace size = place.required("size");
  stream.size = offered(size, codec->sizes, size.size());
  const ProfilePlace rate = place.required("frameRate");
  stream.frame_rate = offered(rate, codec->frame_rates, rate.number(1, kMostFrames));
  if (stream.codec == "jpeg") {
    const ProfilePlace quality = place.required("quality");
    stream.quality = offered(quality, codec->qualities, quality.number(1, kBestQuality));
    place.forbid("bitRate", "is not for JPEG");
  } else {
    const ProfilePlace bit_rate = place.required("bitRate");
    stream.bit_rate = offered(bit_rate, codec->bit_rates, bit_rate.number(1, kMostKilobits));
    place.forbid("quality", "is for JPEG only");
  }
  return stream;
}

void read_codecs(const ProfilePlace& list, CameraProfile& profile) {
  for (const ProfilePlace& place : list.items(kMostCodecs)) {
    OfferedCodec codec = codec_of(place);
    if (profile.codec(codec.word) != nullptr) place.optional("name").refuse("occurs twice among the codecs");
    profile.codecs.push_back(std::move(codec));
  }
}

// The camera takes no size that its capture cannot give or that is above its largest, so it leaves the factory with
// none.
void check_factory_sizes(const ProfilePlace& streams, const CameraProfile& profile) {
  const auto& captures = profile.capture_sizes;
  const auto& limits = profile.max_sizes;
  for (const ProfilePlace& place : streams.items(kMostStreams)) {
    const ProfilePlace size = place.optional("size");
    if (!captures.empty() && !can_be_cut(size.size(), captures.front())) {
      size.refuse("cannot be cut out of the first of captureSizes");
    }
    if (!limits.empty() && !fits(size.size(), limits.front())) size.refuse("is above the first of maxImageSizes");
  }
}

}  // namespace

void read_video_part(const ProfilePlace& video, std::string_view driver, CameraProfile& profile) {
  video.with_only(
      {"streams", "codecs", "standards", "captureSizes", "maxImageSizes", "solidPtz", "electronicFlip", "outputs"});
  read_codecs(video.required("codecs"), profile);
  for (const ProfilePlace& place : video.required("streams").items(kMostStreams)) {
    profile.streams.push_back(stream_of(place, profile));
  }
  profile.standards = video.optional("standards").words({"pal", "ntsc"});
  profile.capture_sizes = video.optional("captureSizes").sizes();
  profile.max_sizes = video.optional("maxImageSizes").sizes();
  check_factory_sizes(video.optional("streams"), profile);
  if (const ProfilePlace solid = video.optional("solidPtz")) profile.solid_ptz = solid.size();
  profile.electronic_flip = video.optional("electronicFlip").flag();
  profile.outputs = video.optional("outputs").words({"ip", "pal", "ntsc"});
  if (driver != "simple-hd" && driver != "simple-ptz") {
    video.forbid("outputs", "is for the drivers \"simple-hd\" and \"simple-ptz\" only");
  }
}

}  // namespace vexa::camera
