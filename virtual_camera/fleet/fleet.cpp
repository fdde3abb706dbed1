// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/fleet/fleet.h"

#include <fcntl.h>
#include <fmt/format.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <map>
#include <nlohmann/json.hpp>
#include <system_error>
#include <utility>

#include "virtual_camera/fleet/control_page.h"
#include "virtual_camera/server/camera_control.h"
#include "virtual_camera/server/control_port.h"
#include "virtual_camera/server/event_loop.h"
#include "virtual_camera/values/fault_words.h"

namespace vexa::camera {
namespace {

using Json = nlohmann::ordered_json;

constexpr std::string_view kCameras = "/camera/";
constexpr std::string_view kEveryCamera = "all";
constexpr std::string_view kList =
    "/                        this list; for a browser, a page\n"
    "/cameras                 all cameras as they are now, as JSON\n"
    "/camera/NAME/...         what follows happens at the camera of this name; \"all\": at every one\n"
    "For instance: curl http://127.0.0.1:PORT/camera/all/lens/cover\n\n";

std::vector<CameraOptions> options_of(const std::vector<FleetCamera>& cameras) {
  std::vector<CameraOptions> options;
  options.reserve(cameras.size());
  for (const FleetCamera& camera : cameras) options.push_back(camera.options);
  return options;
}

// A new file, or one written anew. Empty on success, else why it cannot be written.
std::string write_file(const std::string& path, std::string_view text) {
  constexpr mode_t kOwnerAlone = 0600;
  // Not through a file that others may already read.
  if (::unlink(path.c_str()) != 0 && errno != ENOENT)
    return fmt::format("cannot write {}: {}", path, std::generic_category().message(errno));
  const int file = ::open(path.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, kOwnerAlone);
  bool whole = file >= 0;
  while (whole && !text.empty()) {
    const ssize_t written = ::write(file, text.data(), text.size());
    whole = written > 0 || (written < 0 && errno == EINTR);
    if (written > 0) text.remove_prefix(static_cast<std::size_t>(written));
  }
  const int error = errno;
  if (file >= 0) ::close(file);
  return whole ? "" : fmt::format("cannot write {}: {}", path, std::generic_category().message(error));
}

// The first stream that is set to JPEG, which pages show without decoding; nullopt where a clip decides, or none is.
std::optional<int> jpeg_stream(const FleetCamera& camera, const SettingsStore& settings) {
  constexpr int kMostStreams = 4;
  if (!camera.options.profile || camera.options.clip || !camera.options.clip_path.empty()) return std::nullopt;
  for (int number = 1; number <= kMostStreams; ++number) {
    const auto stream = stream_settings(settings, number);
    if (stream && stream->codec == Codec::kJpeg) return number;
  }
  return std::nullopt;
}

std::string_view file_name(std::string_view path) { return path.substr(path.rfind('/') + 1); }

Json described(const FleetCamera& entry, VirtualCamera& camera) {
  Json faults = Json::object();
  const PacketFaults set = camera.packet_faults();
  const PacketFaults none;
  const auto usual = packet_fault_values(none);
  const auto values = packet_fault_values(set);
  for (std::size_t i = 0; i < values.size(); ++i) {
    if (values[i].second != usual[i].second) faults[std::string(values[i].first)] = values[i].second;
  }
  const SettingsStore& settings = camera.settings();
  return {{"name", entry.name},
          {"profile", entry.profile},
          {"model", settings.get("system", "ModelName").value_or("")},
          {"serial", settings.get("system", "Serial").value_or("")},
          {"mac", settings.get("network", "MacAddress").value_or("")},
          {"address", camera.address()},
          {"httpPort", camera.http_port()},
          {"rtspPort", camera.rtsp_port()},
          {"network", camera.plugged() ? "plugged" : "unplugged"},
          {"viewers", camera.viewers()},
          {"maxViewers", entry.options.max_viewers},
          {"packetFaults", faults},
          {"requestFaults", camera.request_faults()}};
}

std::string text_of(const Json& json) { return json.dump(1, ' ', false, Json::error_handler_t::replace) + "\n"; }

}  // namespace

Fleet::Fleet(std::vector<FleetCamera> cameras, std::size_t threads)
    : cameras_(std::move(cameras)), host_(options_of(cameras_), threads) {
  for (std::size_t i = 0; i < cameras_.size(); ++i) {
    for (const auto& [section, setting] : cameras_[i].settings) {
      host_.camera(i).settings().set(section, setting.first, setting.second);
    }
  }
}

Fleet::~Fleet() { stop(); }

bool Fleet::start(std::optional<std::uint16_t> control_port) {
  if (!host_.start()) {
    error_ = host_.error();
    return false;
  }
  for (std::size_t i = 0; i < cameras_.size(); ++i) {
    if (!cameras_[i].plugged) host_.camera(i).unplug();
  }
  if (!control_port) return true;
  control_loop_ = std::make_unique<EventLoop>();
  control_ = std::make_shared<ControlPort>(control_loop_->context(),
                                           [this](const RequestHead& request) { return answer(request); });
  const asio::error_code failure = control_loop_->run([&] { return control_->open(*control_port); });
  if (!failure) return true;
  error_ = fmt::format("cannot listen on 127.0.0.1:{}: {}", *control_port, failure.message());
  stop();
  return false;
}

void Fleet::stop() {
  if (control_loop_) {
    // Its timer must go before the loop does.
    control_loop_->run([this] {
      control_->close();
      control_.reset();
    });
  }
  control_loop_.reset();  // no answer is under way from here on
  host_.stop();
}

std::uint16_t Fleet::control_port() const { return control_ ? control_->port() : std::uint16_t{0}; }

std::string Fleet::write_cameras_file(const std::string& path) {
  std::map<std::pair<std::string, std::string>, std::string> credentials;
  Json list = Json::array();
  for (std::size_t i = 0; i < cameras_.size(); ++i) {
    const FleetCamera& camera = cameras_[i];
    Json entry = {{"name", camera.name},
                  {"address", fmt::format("{}:{}", host_.camera(i).address(), host_.camera(i).http_port())}};
    if (!camera.profile.empty()) entry["profile"] = camera.profile;
    if (const auto stream = jpeg_stream(camera, host_.camera(i).settings())) entry["tileStream"] = *stream;
    const auto user = std::pair(camera.options.user, camera.options.password);
    if (!user.first.empty() || !user.second.empty()) {
      std::string& file = credentials[user];
      if (file.empty()) {
        file = fmt::format("{}.{}.cred", path, credentials.size());
        std::string failure = write_file(file, fmt::format("{}:{}\n", user.first, user.second));
        if (!failure.empty()) return failure;
      }
      entry["credentials"] = file_name(file);
    }
    list.push_back(std::move(entry));
  }
  return write_file(path, text_of({{"cameras", list}}));
}

std::string Fleet::state() {
  Json list = Json::array();
  for (std::size_t i = 0; i < cameras_.size(); ++i) list.push_back(described(cameras_[i], host_.camera(i)));
  return text_of({{"cameras", list}});
}

std::string_view Fleet::obey(std::string_view name, std::string_view path, std::string_view query) {
  std::string_view status = "404 Not Found";
  for (std::size_t i = 0; i < cameras_.size(); ++i) {
    if (name == kEveryCamera || name == cameras_[i].name) status = host_.camera(i).control(path, query);
  }
  return status;
}

std::string Fleet::answer(const RequestHead& request) {
  if (const ControlFile* file = find_control_file(request.path, request.field("Accept"))) {
    return control_answer("200 OK", file->type, file->text);
  }
  if (request.path == "/")
    return control_answer("200 OK", "text/plain", std::string(kList) + std::string(control_list()));
  if (request.path == "/cameras") return control_answer("200 OK", "application/json", state());
  std::string_view rest = request.path;
  if (!rest.starts_with(kCameras)) return control_answer("404 Not Found");
  rest.remove_prefix(kCameras.size());
  const std::size_t slash = std::min(rest.find('/'), rest.size());
  return control_answer(obey(rest.substr(0, slash), rest.substr(slash), request.query));
}

}  // namespace vexa::camera
