// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/camera_host.h"

#include <fmt/format.h>

#include <algorithm>
#include <asio/ip/address_v4.hpp>
#include <cstdint>
#include <limits>

#include "virtual_camera/codec/rtp_packetiser.h"
#include "virtual_camera/server/event_loop.h"

namespace vexa::camera {

std::string address_after(const std::string& address, std::size_t steps) {
  asio::error_code error;
  const asio::ip::address_v4 start = asio::ip::make_address_v4(address, error);
  if (error || steps > std::numeric_limits<std::uint32_t>::max() - start.to_uint()) return {};
  return asio::ip::address_v4(start.to_uint() + static_cast<std::uint32_t>(steps)).to_string();
}

CameraHost::CameraHost(const CameraOptions& options, std::size_t cameras, std::size_t threads) {
  const std::size_t loops = std::clamp<std::size_t>(threads, 1, std::max<std::size_t>(cameras, 1));
  for (std::size_t i = 0; i < loops; ++i) loops_.push_back(std::make_shared<EventLoop>());
  CameraOptions shared = options;
  if (!shared.clip && !shared.clip_path.empty()) {
    shared.clip = PacketisedClip::load(shared.clip_path, shared.max_payload, shared.user_data);
  }
  for (std::size_t i = 0; i < cameras; ++i) {
    CameraOptions own = shared;
    own.address = address_after(options.address, i);
    own.seed = options.seed + i;
    SettingsStore& settings =
        cameras_.emplace_back(std::make_unique<VirtualCamera>(own, loops_[i % loops]))->settings();
    settings.set("system", "Serial", fmt::format("{}", 100001 + i));
    settings.set("network", "Address", own.address);
    settings.set("network", "MacAddress", fmt::format("02:00:00:00:{:02x}:{:02x}", (i + 1) / 256, (i + 1) % 256));
  }
}

CameraHost::~CameraHost() { stop(); }

bool CameraHost::start() {
  for (const std::unique_ptr<VirtualCamera>& camera : cameras_) {
    if (camera->start()) continue;
    error_ = camera->error();
    stop();
    return false;
  }
  return true;
}

void CameraHost::stop() {
  for (const std::unique_ptr<VirtualCamera>& camera : cameras_) camera->stop();
}

}  // namespace vexa::camera
