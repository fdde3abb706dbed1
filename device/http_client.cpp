// The HTTP members that model classes use: requests, answers, streams.
#include <algorithm>
#include <cstdarg>
#include <cstring>
#include <utility>

#include "device/driver_state.h"
#include "media/assembly/start_code.h"
#include "runtime/base/base64.h"
#include "runtime/base/text.h"
#include "transport/failure.h"
#include "transport/http_receive.h"
#include "transport/http_stream.h"
#include "transport/wire/http_answer.h"
#include "transport/wire/http_request.h"

namespace {

constexpr const char* kSparedInUrls = "$-_.+!*'(),/?&#=";

}  // namespace

int CVexaCommon::http_open(const char* format, ...) {
  vexa::Operation operation(*m_State, __func__);
  va_list arguments;
  va_start(arguments, format);
  const int opened = m_State->errors.run([&]() -> vexa::Result<int> {
    auto socket = m_State->camera.open(vexa::vformat_within(vexa::kRequestRoom, format, arguments).text);
    if (!socket) return socket.failure();
    return socket->release();
  });
  va_end(arguments);
  return opened;
}

int CVexaCommon::http_header_recv(int socket, char* buffer, int length, int timeout) {
  vexa::Operation operation(*m_State, __func__);
  m_State->errors.clear();
  return m_State->errors.run(
      [&] { return vexa::receive_header(socket, vexa::room_of(buffer, length), m_State->limit(timeout)); });
}

int CVexaCommon::http_recv(int socket, char* buffer, int length, int timeout) {
  vexa::Operation operation(*m_State, __func__);
  m_State->errors.clear();
  return m_State->errors.run(
      [&] { return vexa::receive_some(socket, vexa::room_of(buffer, length), m_State->limit(timeout)); });
}

int CVexaCommon::http_recvn(int socket, char* buffer, int length, int timeout) {
  vexa::Operation operation(*m_State, __func__);
  m_State->errors.clear();
  return m_State->errors.run(
      [&] { return vexa::receive_all(socket, vexa::room_of(buffer, length), m_State->limit(timeout)); });
}

int CVexaCommon::http_recvn(int socket, std::string& text, int length, int timeout) {
  vexa::Operation operation(*m_State, __func__);
  m_State->errors.clear();
  return m_State->errors.run([&] { return vexa::receive_text(socket, text, length, m_State->limit(timeout)); });
}

void CVexaCommon::http_close(int socket) { vexa::shutdown_and_close(socket); }

std::string CVexaCommon::AddUrlEncoding(const std::string& text, bool encodeAll) {
  return vexa::percent_encoded(text, encodeAll ? "" : kSparedInUrls);
}

// NOLINTNEXTLINE(performance-unnecessary-value-param): model classes are linked to this signature.
bool CVexaCommon::GetUrlParameter(const std::string& answer, std::string key, std::string& value) {
  const auto found = vexa::cgi_value(answer, key);
  if (!found) return false;
  value = std::string(*found);
  return !value.empty();
}

bool CVexaCommon::GetUrlParameter(const std::string& answer, std::string key, int& value) {
  std::string text;
  if (!GetUrlParameter(answer, std::move(key), text)) return false;
  value = vexa::leading_int(text);
  return true;
}

ELibDReturnCode CVexaCommon::SendInqCommand(const std::string& name, std::string& answer) {
  vexa::Operation operation(*m_State, __func__);
  return m_State->camera.inquire(name, answer) == LIBD_OK ? LIBD_OK : LIBD_FAILED;
}

void CVexaCommon::base64Encode(const char* text, char* output) {
  const std::string encoded = vexa::base64_encode(text);
  std::memcpy(output, encoded.c_str(), encoded.size() + 1);
}

int CVexaCommon::http_multipart_jpeg_recv(int socket, char* buffer, int capacity, int timeout) {
  vexa::Operation operation(*m_State, __func__);
  m_State->errors.clear();
  return m_State->errors.run([&]() -> vexa::Result<int> {
    const auto part = vexa::receive_picture_part(socket, vexa::room_of(buffer, capacity), m_State->limit(timeout));
    if (!part) return part.failure();
    if (part->kind == vexa::PicturePart::Kind::kTooLarge) return vexa::kBufferTooSmall;
    const auto* picture = reinterpret_cast<const unsigned char*>(buffer);
    m_State->store_position({picture, static_cast<std::size_t>(part->length)});
    return part->length;
  });
}

int CVexaCommon::http_multipart_mddata_recv(int socket, char* buffer, int capacity, int timeout) {
  vexa::Operation operation(*m_State, __func__);
  m_State->errors.clear();
  return m_State->errors.run(
      [&] { return vexa::receive_metadata_part(socket, vexa::room_of(buffer, capacity), m_State->limit(timeout)); });
}

int CVexaCommon::http_stream_recv(int socket, char* buffer, int capacity, StartCodeFinder finder, int codeLength,
                                  int timeout) {
  m_State->errors.clear();
  return m_State->errors.run([&] {
    const auto room = vexa::room_of(buffer, capacity);
    vexa::StreamWindow window = m_State->stream_window();
    return vexa::receive_unit({socket, m_State->stream_source().stop}, window,
                              {finder, static_cast<std::size_t>(codeLength)},
                              {reinterpret_cast<unsigned char*>(room.data()), room.size()}, timeout);
  });
}

const unsigned char* CVexaCommon::find_start_code_h264(const unsigned char* data, unsigned int length) {
  return vexa::find_start_code_h264(data, length);
}

const unsigned char* CVexaCommon::find_start_code_mpeg4(const unsigned char* data, unsigned int length) {
  return vexa::find_start_code_mpeg4(data, length);
}
