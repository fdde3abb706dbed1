// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/camera_host.h"

#include <fmt/format.h>

#include <algorithm>
#include <asio/ip/address_v4.hpp>
#include <cstdint>
#include <limits>
#include <map>
#include <utility>

#include "virtual_camera/codec/rtp_packetiser.h"
#include "virtual_camera/server/event_loop.h"

namespace vexa::camera {

std::string address_after(const std::string& address, std::size_t steps) {
  asio::error_code error;
  const asio::ip::address_v4 start = asio::ip::make_address_v4(address, error);
  if (error || steps > std::numeric_limits<std::uint32_t>::max() - start.to_uint()) return {};
  return asio::ip::address_v4(start.to_uint() + static_cast<std::uint32_t>(steps)).to_string();
}

namespace {

std::vector<CameraOptions> consecutive(const CameraOptions& first, std::size_t cameras) {
  std::vector<CameraOptions> all(cameras, first);
  for (std::size_t i = 0; i < cameras; ++i) {
    all[i].address = address_after(first.address, i);
    all[i].seed = first.seed + i;
  }
  return all;
}

}  // namespace

CameraHost::CameraHost(const CameraOptions& options, std::size_t cameras, std::size_t threads)
    : CameraHost(consecutive(options, cameras), threads) {}

CameraHost::CameraHost(std::vector<CameraOptions> cameras, std::size_t threads) {
  const std::size_t loops = std::clamp<std::size_t>(threads, 1, std::max<std::size_t>(cameras.size(), 1));
  for (std::size_t i = 0; i < loops; ++i) loops_.push_back(std::make_shared<EventLoop>());
  std::map<std::string, std::shared_ptr<const PacketisedClip>> clips;
  for (std::size_t i = 0; i < cameras.size(); ++i) {
    CameraOptions& own = cameras[i];
    if (!own.clip && !own.clip_path.empty()) {
      std::shared_ptr<const PacketisedClip>& clip = clips[own.clip_path];
      if (!clip) clip = PacketisedClip::load(own.clip_path, own.max_payload, own.user_data);
      own.clip = clip;
    }
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
