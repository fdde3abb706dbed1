// Frames from the camera's HTTP image stream.
#include <sys/time.h>

#include <chrono>
#include <new>
#include <utility>

#include "device/driver_state.h"
#include "media/picture_reader.h"
#include "transport/failure.h"
#include "transport/http_stream.h"

namespace {

/// Twice the largest frame and more, so that a frame under work is seldom moved.
constexpr std::size_t kStreamBuffer = std::size_t{4} << 20;

void stamp_now(CVexaCommon::VideoFrameInfo& frame) {
  timeval now{};
  gettimeofday(&now, nullptr);
  frame.seconds = static_cast<std::int32_t>(now.tv_sec);
  frame.microseconds = static_cast<std::int32_t>(now.tv_usec);
}

}  // namespace

ELibDReturnCode CVexaCommon::GetCurrentFrameData(VideoFrameInfo& frame) {
  if (m_State->stream_socket() == -1) return LIBD_FAILED;
  const vexa::Codec* codec = vexa::codec_named(m_State->stream_codec());
  if (codec == nullptr) return LIBD_FAILED;
  int received = 0;
  switch (codec->kind) {
    case vexa::CodecKind::kJpeg:
      return GetCurrentJPEGFrameData(frame, received);
    case vexa::CodecKind::kMpeg4:
      return GetCurrentMPEGFrameData(frame, received);
    case vexa::CodecKind::kH264:
      return GetCurrentH264FrameData(frame, received);
  }
  return LIBD_FAILED;
}

ELibDReturnCode CVexaCommon::GetCurrentJPEGFrameData(VideoFrameInfo& frame, int& received) {
  frame.frameType = VIDEO_FRAME_JPEG;
  m_State->begin_frame();
  m_State->errors.clear();
  received = -1;
  const vexa::StoppableSocket source = m_State->stream_source();
  const vexa::WaitLimit limit{m_State->connection.timeout(), {nullptr, nullptr, source.stop}};
  const auto part =
      vexa::receive_picture_part(source.socket, {reinterpret_cast<char*>(frame.data), frame.capacity}, limit);
  if (!part && m_State->stop_is_requested()) return LIBD_NO_FRAME;
  if (!part) {
    m_State->errors.record(part.failure());
    return part.failure().code;
  }
  if (part->kind == vexa::PicturePart::Kind::kTooLarge) {
    m_State->ledger.part_begun();
    m_State->ledger.part_too_large();
    m_State->errors.record({LIBD_BUFFER_TOO_SMALL, vexa::kBufferTooSmall.text});
    m_LastFrameTime = m_State->now();
    return LIBD_BUFFER_TOO_SMALL;
  }
  received = part->length;
  if (received == 0) return m_State->nothing_yet();
  frame.length = static_cast<unsigned int>(received);
  m_State->store_position({frame.data, frame.length});
  m_LastFrameTime = m_State->now();
  m_State->part_is_ready(frame, vexa::kJpegCodec);
  return LIBD_OK;
}

ELibDReturnCode CVexaCommon::GetCurrentH264FrameData(VideoFrameInfo& frame, int& received) {
  return m_State->read_elementary_frame(frame, vexa::kH264Codec, received);
}

ELibDReturnCode CVexaCommon::GetCurrentMPEGFrameData(VideoFrameInfo& frame, int& received) {
  return m_State->read_elementary_frame(frame, vexa::kMpeg4Codec, received);
}

namespace vexa {

bool DriverState::reset_stream_buffer() {
  if (driver.m_StreamBuffer == nullptr) driver.m_StreamBuffer = new (std::nothrow) unsigned char[kStreamBuffer];
  driver.m_StreamBufferSize = driver.m_StreamBuffer == nullptr ? 0 : kStreamBuffer;
  driver.m_StreamFrameStart = driver.m_StreamSearchPos = driver.m_StreamWriteEnd = driver.m_StreamBuffer;
  return driver.m_StreamBuffer != nullptr;
}

void DriverState::release_stream_buffer() {
  delete[] std::exchange(driver.m_StreamBuffer, nullptr);
  driver.m_StreamBufferSize = 0;
  driver.m_StreamFrameStart = driver.m_StreamSearchPos = driver.m_StreamWriteEnd = nullptr;
}

StreamWindow DriverState::stream_window() {
  return {{driver.m_StreamBuffer, driver.m_StreamBufferSize},
          {driver.m_StreamFrameStart, driver.m_StreamSearchPos, driver.m_StreamWriteEnd}};
}

void DriverState::part_is_ready(const CVexaCommon::VideoFrameInfo& frame, const Codec& codec) {
  ledger.part_begun();
  ledger.bytes(frame.length, std::chrono::steady_clock::now());
  ledger.part_assembled();
  frame_is_ready(frame, codec, facts_of(frame, codec, {}));
}

// A frame that has begun and is not whole.
void DriverState::part_is_lost(const CVexaCommon::VideoFrameInfo& frame) {
  if (frame.length == 0) return;
  ledger.part_begun();
  ledger.bytes(frame.length, std::chrono::steady_clock::now());
  if (frame.length >= frame.capacity) {
    ledger.part_too_large();
  } else {
    ledger.part_incomplete();
  }
  ledger.publish();
}

// Kept: units in front of a picture are lost when the stream falls silent after them; the next read begins anew.
ELibDReturnCode DriverState::read_elementary_frame(CVexaCommon::VideoFrameInfo& frame, const Codec& codec,
                                                   int& received) {
  frame.frameType = VIDEO_FRAME_INVALID;
  frame.length = 0;
  begin_frame();
  StreamWindow window = stream_window();
  const StoppableSocket source = stream_source();
  const auto user_data = [this](Bytes text) {
    driver.GetUserDataFromStream(text.data(), static_cast<unsigned int>(text.size()));
  };
  while (frame.length < frame.capacity) {
    errors.clear();
    const auto unit = read_unit(source, window, codec, {{frame.data, frame.capacity}, frame.length, frame.frameType},
                                connection.timeout(), user_data);
    received = unit ? unit->length : -1;
    if (!unit) {
      part_is_lost(frame);
      errors.record(unit.failure());
      return unit.failure().code;
    }
    if (unit->kind == UnitRead::Kind::kPicture) {
      stamp_now(frame);
      driver.m_LastFrameTime = now();
      part_is_ready(frame, codec);
      return LIBD_OK;
    }
    const ELibDReturnCode waited = nothing_yet();
    if (unit->kind == UnitRead::Kind::kSilence || waited == LIBD_TIMEOUT) {
      part_is_lost(frame);
      return waited;
    }
  }
  part_is_lost(frame);
  return LIBD_FAILED;
}

}  // namespace vexa
