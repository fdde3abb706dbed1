// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/program/journal_file.h"

#include <chrono>
#include <nlohmann/json.hpp>
#include <string_view>

namespace vexa::camera {
namespace {

// ISO 8859-1 to UTF-8.
std::string text_of(std::string_view bytes) {
  std::string text;
  for (const char c : bytes) {
    const auto byte = static_cast<unsigned char>(c);
    if (byte < 0x80) {
      text += c;
    } else {
      text += static_cast<char>(0xC0U | (byte >> 6U));
      text += static_cast<char>(0x80U | (byte & 0x3FU));
    }
  }
  return text;
}

}  // namespace

std::string journal_line(const std::string& camera, const Request& request) {
  const std::chrono::duration<double> time = request.time.time_since_epoch();
  const nlohmann::ordered_json line = {{"camera", camera},
                                       {"kind", request.kind == RequestKind::kHttp ? "http" : "rtsp"},
                                       {"peer", request.peer},
                                       {"time", time.count()},
                                       {"status", request.status},
                                       {"request", text_of(request.bytes)},
                                       {"answer", text_of(request.answer)}};
  return line.dump();
}

void JournalFile::add(const std::string& camera, const Request& request) {
  const std::lock_guard<std::mutex> lock(mutex_);
  file_ << journal_line(camera, request) << "\n" << std::flush;
}

}  // namespace vexa::camera
