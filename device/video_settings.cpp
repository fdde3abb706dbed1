// Video settings of one stream, and the codecs and sizes that the camera's properties leave.
#include <new>
#include <utility>

#include "device/cgi/video_text.h"
#include "device/driver_state.h"
#include "runtime/base/number_pair.h"
#include "runtime/base/sync.h"
#include "runtime/base/text.h"
#include "vexa/vexa_common.h"

namespace {

constexpr char kVideoStandardKey[] = "VideoStd=";
constexpr char kCaptureSizeKey[] = "VidCapSize=";
constexpr char kSolidPtzKey[] = "SolidPTZ=";
constexpr char kMaxSizeKey[] = "ImageMaxSize=";

constexpr char kCaptureSizeFilter[] = "VideoCapSizeFilter";
constexpr char kSolidPtzFilter[] = "SolidPTZFilter";
constexpr char kMaxSizeFilter[] = "ImageMaxSizeFilter";

constexpr int kNoSize = -1;
constexpr int kFlippedRotation = 180;
constexpr std::size_t kCaptureSizeRoom = 20;
constexpr std::size_t kMaxSizeRoom = 64;

/// Takes a fixed key's value; `pos` moves from the key to the value's end.
template <std::size_t kSize>
std::string take_value(const std::string& answer, std::size_t& pos, const char (&)[kSize]) {
  const vexa::PlacedValue value = vexa::value_behind(answer, pos, kSize - 1);
  pos = value.end;
  return std::string(value.text);
}

std::string take_value(const std::string& answer, std::size_t& pos, const std::string& key) {
  const vexa::PlacedValue value = vexa::value_behind(answer, pos, key.size());
  pos = value.end;
  return std::string(value.text);
}

// Kept: no word boundary. A key is also found at the end of a longer one; cameras answer the plain keys first.
bool find_key(const std::string& answer, const std::string& key, std::size_t& pos) {
  pos = answer.find(key);
  return pos != std::string::npos;
}

/// Stores a value. True when another was there before.
template <typename Value>
bool replace(Value& stored, Value value) {
  const bool differs = stored != value;
  stored = value;
  return differs;
}

}  // namespace

// Safe: settings that memory does not hold are a failure and not an exception.
ELibDReturnCode CVexaCommon::GetCameraInfo(SLibDCameraInfo& info) try {
  StoreCameraInquiry({});
  std::string answer;
  if (SendInqCommand("camera", answer) != LIBD_OK) return LatestErrorCode();
  StoreCameraInquiry(answer);
  const vexa::Guard filter(m_State->filter_lock);
  m_ResolutionFilter.Initialize(m_FixedSystemInfo.modelName);
  const vexa::Guard guard(m_ConnectionLock);
  ReadCameraProperties(answer);
  ReadStreamSettings(answer, info.streamNumber);
  ReadVideoPorts(answer);
  // Kept: the record comes back whole, the driver's stream number with it; hosts set the number before each call.
  info = m_CameraInfo;
  return LIBD_OK;
} catch (const std::bad_alloc&) {
  return FailMemory();
}

void CVexaCommon::StoreCameraInquiry(const std::string& answer) {
  const vexa::Guard guard(m_CameraInquiryLock);
  m_CameraInquiryCache = answer;
}

void CVexaCommon::ReadCameraProperties(const std::string& answer) {
  bool changed = false;
  std::size_t pos = 0;
  if (find_key(answer, kVideoStandardKey, pos)) ParseVideoStandardFromCameraProperty(answer, pos, changed);
  if (find_key(answer, kCaptureSizeKey, pos)) ParseVideoCapSizeFromCameraProperty(answer, pos, changed);
  if (find_key(answer, kSolidPtzKey, pos)) ParseSolidPTZFromCameraProperty(answer, pos, changed);
  if (find_key(answer, kMaxSizeKey, pos)) ParseImageMaxSizeFromCameraProperty(answer, pos, changed);
  if (!changed) return;
  InitializeFixedVideoParams(static_cast<ELibDVideoStandard>(m_CameraInfo.videoStandard), m_CameraInfo.captureWidth,
                             m_CameraInfo.captureHeight);
  m_ResolutionFilter.GetFilteredResolutionList(m_FixedCameraInfo.codecs);
}

void CVexaCommon::ParseVideoStandardFromCameraProperty(const std::string& answer, std::size_t& pos, bool& changed) {
  const std::int32_t standard = vexa::video_standard_of(take_value(answer, pos, kVideoStandardKey));
  if (replace(m_CameraInfo.videoStandard, standard)) changed = true;
}

void CVexaCommon::ParseVideoCapSizeFromCameraProperty(const std::string& answer, std::size_t& pos, bool& changed) {
  const std::string value = take_value(answer, pos, kCaptureSizeKey);
  const auto size = vexa::leading_pair(value);
  if (!size) return;
  m_ResolutionFilter.SetFilterItemCriteria(kCaptureSizeFilter, value);
  if (replace(m_CameraInfo.captureWidth, size->first)) changed = true;
  if (replace(m_CameraInfo.captureHeight, size->second)) changed = true;
}

void CVexaCommon::ParseSolidPTZFromCameraProperty(const std::string& answer, std::size_t& pos, bool& changed) {
  const std::string value = take_value(answer, pos, kSolidPtzKey);
  m_ResolutionFilter.SetFilterItemCriteria(kSolidPtzFilter, value);
  // Kept: only "on" in small letters counts here, while the filter gets the camera's own word.
  if (replace(m_CameraInfo.solidPtz, value == "on")) changed = true;
}

void CVexaCommon::ParseImageMaxSizeFromCameraProperty(const std::string& answer, std::size_t& pos, bool& changed) {
  const std::string value = take_value(answer, pos, kMaxSizeKey);
  const auto size = vexa::leading_pair(value);
  if (!size) return;
  m_ResolutionFilter.SetFilterItemCriteria(kMaxSizeFilter, value);
  if (replace(m_CameraInfo.maxImageWidth, size->first)) changed = true;
  if (replace(m_CameraInfo.maxImageHeight, size->second)) changed = true;
}

void CVexaCommon::ReadStreamSettings(const std::string& answer, int stream) {
  const std::string codec_key = vexa::stream_key("ImageCodec", stream);
  const std::string size_key = vexa::stream_key("ImageSize", stream);
  const std::string rate_key = vexa::stream_key("FrameRate", stream);
  std::int32_t codec_type = 0;
  std::size_t pos = 0;
  if (find_key(answer, codec_key, pos)) SetCurrentStreamMode(answer, pos, codec_type, codec_key);
  if (find_key(answer, size_key, pos)) SetCurrentResolution(answer, pos, size_key);
  if (find_key(answer, rate_key, pos)) SetCurrentFrameRate(answer, pos, rate_key);
  const std::string bound_key = vexa::stream_key(codec_type == 0 ? "Quality" : "BitRate", stream);
  if (find_key(answer, bound_key, pos)) SetCurrentQualityBitrate(answer, pos, codec_type, bound_key);
  // Kept: a codec that is missing or unknown makes the type 0 while its name stays; hosts go by the name.
  m_CameraInfo.codecType = codec_type;
}

void CVexaCommon::SetCurrentStreamMode(const std::string& answer, std::size_t& pos, std::int32_t& codecType,
                                       const std::string& key) {
  const vexa::VideoCodec* codec = vexa::video_codec_of(take_value(answer, pos, key));
  if (codec == nullptr) return;
  m_CameraInfo.codecName = codec->name;
  codecType = codec->codecType;
}

void CVexaCommon::SetCurrentResolution(const std::string& answer, std::size_t& pos, const std::string& key) {
  const vexa::StreamSize size = vexa::read_stream_size(take_value(answer, pos, key));
  m_CameraInfo.imageWidth = size.width;
  m_CameraInfo.imageHeight = size.height;
  if (size.text) m_CameraInfo.imageSizeText = *size.text;
}

void CVexaCommon::SetCurrentFrameRate(const std::string& answer, std::size_t& pos, const std::string& key) {
  const std::string value = take_value(answer, pos, key);
  m_CameraInfo.frameRate = vexa::leading_int(value);
  m_CameraInfo.frameRateText = value + "fps";
}

void CVexaCommon::SetCurrentQualityBitrate(const std::string& answer, std::size_t& pos, std::int32_t codecType,
                                           const std::string& key) {
  const std::string value = take_value(answer, pos, key);
  if (codecType == 0) {
    m_CameraInfo.quality = vexa::leading_int(value);
    m_CameraInfo.qualityText = "Level " + value;
  } else {
    m_CameraInfo.bitRate = vexa::leading_int(value);
    m_CameraInfo.bitRateText = value + "kbit/s";
  }
}

void CVexaCommon::ReadVideoPorts(const std::string& answer) {
  const struct {
    const char* key;
    std::int32_t& port;
  } ports[] = {{"UcVideoPort=", m_CameraInfo.unicastVideoPort},
               {"UcVideoPort1=", m_CameraInfo.unicastVideoPort1},
               {"UcVideoPort2=", m_CameraInfo.unicastVideoPort2},
               {"RTSPPort=", m_CameraInfo.rtspPort}};
  for (const auto& [key, port] : ports) {
    std::size_t pos = 0;
    if (find_key(answer, key, pos)) port = vexa::leading_int(take_value(answer, pos, std::string(key)));
  }
}

// Safe: as GetCameraInfo; a record that memory does not hold twice is not sent.
ELibDReturnCode CVexaCommon::SetCameraInfo(SLibDCameraInfo& info) try {
  SLibDCameraInfo stored = info;
  const vexa::CodecRequest codec = vexa::codec_request(info);
  const int stream = info.streamNumber;
  const ELibDReturnCode sent =
      TakesElectronicFlip()
          ? SendCommand("/command/camera.cgi?ImageCodec%d=%s&ImageSize%d=%d,%d&FrameRate%d=%d&%s%d=%d&Eflip=%s", stream,
                        codec.word, stream, info.imageWidth, info.imageHeight, stream, info.frameRate, codec.rateKey,
                        stream, codec.rate, info.rotation == kFlippedRotation ? "on" : "off")
          : SendCommand("/command/camera.cgi?ImageCodec%d=%s&ImageSize%d=%d,%d&FrameRate%d=%d&%s%d=%d", stream,
                        codec.word, stream, info.imageWidth, info.imageHeight, stream, info.frameRate, codec.rateKey,
                        stream, codec.rate);
  if (sent != LIBD_OK) return sent;
  const vexa::Guard guard(m_ConnectionLock);
  std::swap(m_CameraInfo, stored);
  return LIBD_OK;
} catch (const std::bad_alloc&) {
  return FailMemory();
}

bool CVexaCommon::TakesElectronicFlip() {
  const vexa::Guard guard(m_State->filter_lock);
  return m_FixedCameraInfo.electronicFlip != 0;
}

// Safe: as GetCameraInfo.
ELibDReturnCode CVexaCommon::GetFixedCameraInfo(SLibDFixedCameraInfo& info) try {
  const vexa::Guard guard(m_State->filter_lock);
  if (!m_FixedCameraInfoAvailable) return LIBD_NOT_SUPPORTED;
  info = m_FixedCameraInfo;
  return LIBD_OK;
} catch (const std::bad_alloc&) {
  return FailMemory();
}

// Kept: the standard is passed on and not stored; what is offered stays until the camera reports the standard.
ELibDReturnCode CVexaCommon::SetVideoStandard(ELibDVideoStandard standard) {
  const vexa::Guard guard(m_State->filter_lock);
  InitializeFixedVideoParams(standard, kNoSize, kNoSize);
  return LIBD_OK;
}

// Safe: as GetCameraInfo.
ELibDReturnCode CVexaCommon::SetVidCapSize(int width, int height) try {
  const vexa::Guard guard(m_State->filter_lock);
  InitializeFixedVideoParams(StoredVideoStandard(), width, height);
  FilterBy(kCaptureSizeFilter, vexa::format_within(kCaptureSizeRoom, "%d,%d", width, height).text);
  return LIBD_OK;
} catch (const std::bad_alloc&) {
  return FailMemory();
}

// Safe: as GetCameraInfo.
ELibDReturnCode CVexaCommon::SetSolidPTZState(bool on) try {
  const vexa::Guard guard(m_State->filter_lock);
  InitializeFixedVideoParams(StoredVideoStandard(), kNoSize, kNoSize);
  FilterBy(kSolidPtzFilter, on ? "on" : "off");
  return LIBD_OK;
} catch (const std::bad_alloc&) {
  return FailMemory();
}

// Safe: as GetCameraInfo.
ELibDReturnCode CVexaCommon::SetImageMaxSize(int width, int height, ELibDVideoStandard standard) try {
  const vexa::Guard guard(m_State->filter_lock);
  InitializeFixedVideoParams(standard, width, height);
  FilterBy(kMaxSizeFilter, vexa::format_within(kMaxSizeRoom, "%d,%d", width, height).text);
  return LIBD_OK;
} catch (const std::bad_alloc&) {
  return FailMemory();
}

ELibDVideoStandard CVexaCommon::StoredVideoStandard() {
  const vexa::Guard guard(m_ConnectionLock);
  return static_cast<ELibDVideoStandard>(m_CameraInfo.videoStandard);
}

// Kept: the filter starts afresh, so that what is offered follows the one property a host has just set.
void CVexaCommon::FilterBy(const char* item, const std::string& value) {
  m_ResolutionFilter.Initialize(m_FixedSystemInfo.modelName);
  m_ResolutionFilter.SetFilterItemCriteria(item, value);
  m_ResolutionFilter.GetFilteredResolutionList(m_FixedCameraInfo.codecs);
}
