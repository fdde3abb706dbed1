// Video settings of one stream, and the codecs and sizes that the camera's properties leave.
#include <utility>

#include "device/cgi/video_text.h"
#include "device/driver_state.h"
#include "runtime/base/scanned_number.h"
#include "runtime/base/sync.h"
#include "runtime/base/text.h"
#include "runtime/base/undo.h"

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
std::string value_at(const std::string& answer, std::size_t& pos, const char (&)[kSize]) {
  const vexa::PlacedValue value = vexa::value_behind(answer, pos, kSize - 1);
  pos = value.end;
  return std::string(value.text);
}

std::string value_at(const std::string& answer, std::size_t& pos, const std::string& key) {
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

ELibDReturnCode CVexaCommon::GetCameraInfo(SLibDCameraInfo& info) {
  vexa::Operation operation(*m_State, __func__);
  return m_State->errors.run([&]() -> vexa::Outcome {
    m_State->store_camera_inquiry({});
    std::string answer;
    if (const auto asked = m_State->camera.inquire("camera", answer); asked != LIBD_OK) return asked;
    m_State->store_camera_inquiry(answer);
    m_State->read_camera_answer(answer, info);
    return LIBD_OK;
  });
}

namespace vexa {

void DriverState::store_camera_inquiry(const std::string& answer) {
  const Guard guard(driver.m_CameraInquiryLock);
  driver.m_CameraInquiryCache = answer;
}

// The hook runs between the properties and the rest, with no lock held: it may send commands.
void DriverState::read_camera_answer(const std::string& answer, SLibDCameraInfo& info) {
  bool changed = false;
  ELibDVideoStandard standard{};
  int width = 0;
  int height = 0;
  {
    const Guard guard(driver.m_ConnectionLock);
    driver.m_ResolutionFilter.Initialize(driver.m_FixedSystemInfo.modelName);
    Undo properties(driver.m_CameraInfo);
    if (read_camera_properties(answer)) offer_is_stale = true;
    properties.keep();
    changed = offer_is_stale;
    standard = static_cast<ELibDVideoStandard>(driver.m_CameraInfo.videoStandard);
    width = driver.m_CameraInfo.captureWidth;
    height = driver.m_CameraInfo.captureHeight;
  }
  if (changed) driver.InitializeFixedVideoParams(standard, width, height);
  const Guard guard(driver.m_ConnectionLock);
  if (changed) offer_filtered();
  offer_is_stale = false;
  Undo change(driver.m_CameraInfo);
  read_stream_settings(answer, info.streamNumber);
  read_video_ports(answer);
  // Kept: the record comes back whole, the driver's stream number with it; hosts set the number before each call.
  put_whole(info, driver.m_CameraInfo);
  change.keep();
}

bool DriverState::read_camera_properties(const std::string& answer) {
  bool changed = false;
  std::size_t pos = 0;
  if (find_key(answer, kVideoStandardKey, pos)) driver.ParseVideoStandardFromCameraProperty(answer, pos, changed);
  if (find_key(answer, kCaptureSizeKey, pos)) driver.ParseVideoCapSizeFromCameraProperty(answer, pos, changed);
  if (find_key(answer, kSolidPtzKey, pos)) driver.ParseSolidPTZFromCameraProperty(answer, pos, changed);
  if (find_key(answer, kMaxSizeKey, pos)) driver.ParseImageMaxSizeFromCameraProperty(answer, pos, changed);
  return changed;
}

void DriverState::read_stream_settings(const std::string& answer, int stream) {
  const std::string codec_key = stream_key("ImageCodec", stream);
  const std::string size_key = stream_key("ImageSize", stream);
  const std::string rate_key = stream_key("FrameRate", stream);
  std::int32_t codec_type = 0;
  std::size_t pos = 0;
  if (find_key(answer, codec_key, pos)) driver.SetCurrentStreamMode(answer, pos, codec_type, codec_key);
  if (find_key(answer, size_key, pos)) driver.SetCurrentResolution(answer, pos, size_key);
  if (find_key(answer, rate_key, pos)) driver.SetCurrentFrameRate(answer, pos, rate_key);
  const std::string bound_key = stream_key(codec_type == 0 ? kJpegCodec.rate_key : kH264Codec.rate_key, stream);
  if (find_key(answer, bound_key, pos)) driver.SetCurrentQualityBitrate(answer, pos, codec_type, bound_key);
  // Kept: a codec that is missing or unknown makes the type 0 while its name stays; hosts go by the name.
  driver.m_CameraInfo.codecType = codec_type;
}

ELibDReturnCode DriverState::choose_stream(const std::string& answer, int stream) {
  const std::string key = stream_key("ImageCodec", stream);
  std::size_t pos = 0;
  if (!find_key(answer, key, pos) || video_codec_of(value_at(answer, pos, key)) == nullptr) return LIBD_NOT_SUPPORTED;
  const Guard guard(driver.m_ConnectionLock);
  Undo change(driver.m_CameraInfo);
  read_stream_settings(answer, stream);
  driver.m_CameraInfo.streamNumber = stream;
  change.keep();
  return LIBD_OK;
}

void DriverState::read_video_ports(const std::string& answer) {
  const struct {
    const char* key;
    std::int32_t& port;
  } ports[] = {{"UcVideoPort=", driver.m_CameraInfo.unicastVideoPort},
               {"UcVideoPort1=", driver.m_CameraInfo.unicastVideoPort1},
               {"UcVideoPort2=", driver.m_CameraInfo.unicastVideoPort2},
               {"RTSPPort=", driver.m_CameraInfo.rtspPort}};
  for (const auto& [key, port] : ports) {
    std::size_t pos = 0;
    if (find_key(answer, key, pos)) port = leading_int(value_at(answer, pos, std::string(key)));
  }
}

// Kept: the filter starts afresh, so that what is offered follows the one property a host has just set.
void DriverState::filter_by(const char* item, const std::string& value) {
  const Guard guard(driver.m_ConnectionLock);
  driver.m_ResolutionFilter.Initialize(driver.m_FixedSystemInfo.modelName);
  driver.m_ResolutionFilter.SetFilterItemCriteria(item, value);
  offer_filtered();
}

void DriverState::offer_filtered() {
  std::vector<SLibDVideoCodecInfo> left;
  driver.m_ResolutionFilter.GetFilteredResolutionList(left);
  driver.m_FixedCameraInfo.codecs.swap(left);
}

}  // namespace vexa

void CVexaCommon::ParseVideoStandardFromCameraProperty(const std::string& answer, std::size_t& pos, bool& changed) {
  const std::int32_t standard = vexa::video_standard_of(value_at(answer, pos, kVideoStandardKey));
  if (replace(m_CameraInfo.videoStandard, standard)) changed = true;
}

void CVexaCommon::ParseVideoCapSizeFromCameraProperty(const std::string& answer, std::size_t& pos, bool& changed) {
  const std::string value = value_at(answer, pos, kCaptureSizeKey);
  const auto size = vexa::leading_pair(value);
  if (!size) return;
  m_ResolutionFilter.SetFilterItemCriteria(kCaptureSizeFilter, value);
  if (replace(m_CameraInfo.captureWidth, size->first)) changed = true;
  if (replace(m_CameraInfo.captureHeight, size->second)) changed = true;
}

void CVexaCommon::ParseSolidPTZFromCameraProperty(const std::string& answer, std::size_t& pos, bool& changed) {
  const std::string value = value_at(answer, pos, kSolidPtzKey);
  m_ResolutionFilter.SetFilterItemCriteria(kSolidPtzFilter, value);
  // Kept: only "on" in small letters counts here, while the filter gets the camera's own word.
  if (replace(m_CameraInfo.solidPtz, value == "on")) changed = true;
}

void CVexaCommon::ParseImageMaxSizeFromCameraProperty(const std::string& answer, std::size_t& pos, bool& changed) {
  const std::string value = value_at(answer, pos, kMaxSizeKey);
  const auto size = vexa::leading_pair(value);
  if (!size) return;
  m_ResolutionFilter.SetFilterItemCriteria(kMaxSizeFilter, value);
  if (replace(m_CameraInfo.maxImageWidth, size->first)) changed = true;
  if (replace(m_CameraInfo.maxImageHeight, size->second)) changed = true;
}

void CVexaCommon::SetCurrentStreamMode(const std::string& answer, std::size_t& pos, std::int32_t& codecType,
                                       const std::string& key) {
  const vexa::Codec* codec = vexa::video_codec_of(value_at(answer, pos, key));
  if (codec == nullptr) return;
  m_CameraInfo.codecName = codec->name;
  codecType = static_cast<std::int32_t>(codec->kind);
}

void CVexaCommon::SetCurrentResolution(const std::string& answer, std::size_t& pos, const std::string& key) {
  const vexa::StreamSize size = vexa::read_stream_size(value_at(answer, pos, key));
  m_CameraInfo.imageWidth = size.width;
  m_CameraInfo.imageHeight = size.height;
  if (size.text) m_CameraInfo.imageSizeText = *size.text;
}

void CVexaCommon::SetCurrentFrameRate(const std::string& answer, std::size_t& pos, const std::string& key) {
  const std::string value = value_at(answer, pos, key);
  m_CameraInfo.frameRate = vexa::leading_int(value);
  m_CameraInfo.frameRateText = value + "fps";
}

void CVexaCommon::SetCurrentQualityBitrate(const std::string& answer, std::size_t& pos, std::int32_t codecType,
                                           const std::string& key) {
  const std::string value = value_at(answer, pos, key);
  if (codecType == 0) {
    m_CameraInfo.quality = vexa::leading_int(value);
    m_CameraInfo.qualityText = "Level " + value;
  } else {
    m_CameraInfo.bitRate = vexa::leading_int(value);
    m_CameraInfo.bitRateText = value + "kbit/s";
  }
}

ELibDReturnCode CVexaCommon::SetCameraInfo(SLibDCameraInfo& info) {
  vexa::Operation operation(*m_State, __func__);
  return m_State->errors.run([&]() -> vexa::Outcome {
    SLibDCameraInfo stored = info;  // first, so that nothing is sent that cannot be stored
    const vexa::CodecRequest codec = vexa::codec_request(info);
    const int stream = info.streamNumber;
    const char* flip = "";
    if (m_State->takes_electronic_flip()) flip = info.rotation == kFlippedRotation ? "&Eflip=on" : "&Eflip=off";
    const ELibDReturnCode sent = m_State->camera.send(
        "/command/camera.cgi?ImageCodec%d=%s&ImageSize%d=%d,%d&FrameRate%d=%d&%s%d=%d%s", stream, codec.word, stream,
        info.imageWidth, info.imageHeight, stream, info.frameRate, codec.rateKey, stream, codec.rate, flip);
    if (sent != LIBD_OK) return sent;
    const vexa::Guard guard(m_ConnectionLock);
    std::swap(m_CameraInfo, stored);
    return LIBD_OK;
  });
}

ELibDReturnCode CVexaCommon::GetFixedCameraInfo(SLibDFixedCameraInfo& info) {
  vexa::Operation operation(*m_State, __func__);
  return m_State->errors.run([&]() -> vexa::Outcome {
    const vexa::Guard guard(m_ConnectionLock);
    if (!m_FixedCameraInfoAvailable) return LIBD_NOT_SUPPORTED;
    vexa::put_whole(info, m_FixedCameraInfo);
    return LIBD_OK;
  });
}

// Kept: the standard is passed on and not stored; what is offered stays until the camera reports the standard.
ELibDReturnCode CVexaCommon::SetVideoStandard(ELibDVideoStandard standard) {
  vexa::Operation operation(*m_State, __func__);
  InitializeFixedVideoParams(standard, kNoSize, kNoSize);
  return LIBD_OK;
}

ELibDReturnCode CVexaCommon::SetVidCapSize(int width, int height) {
  vexa::Operation operation(*m_State, __func__);
  return m_State->errors.run([&]() -> vexa::Outcome {
    InitializeFixedVideoParams(m_State->video_standard(), width, height);
    m_State->filter_by(kCaptureSizeFilter, vexa::format_within(kCaptureSizeRoom, "%d,%d", width, height).text);
    return LIBD_OK;
  });
}

ELibDReturnCode CVexaCommon::SetSolidPTZState(bool on) {
  vexa::Operation operation(*m_State, __func__);
  return m_State->errors.run([&]() -> vexa::Outcome {
    InitializeFixedVideoParams(m_State->video_standard(), kNoSize, kNoSize);
    m_State->filter_by(kSolidPtzFilter, on ? "on" : "off");
    return LIBD_OK;
  });
}

ELibDReturnCode CVexaCommon::SetImageMaxSize(int width, int height, ELibDVideoStandard standard) {
  vexa::Operation operation(*m_State, __func__);
  return m_State->errors.run([&]() -> vexa::Outcome {
    InitializeFixedVideoParams(standard, width, height);
    m_State->filter_by(kMaxSizeFilter, vexa::format_within(kMaxSizeRoom, "%d,%d", width, height).text);
    return LIBD_OK;
  });
}
