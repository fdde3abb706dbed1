// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/virtual_camera.h"

#include <utility>

#include "virtual_camera/server/camera_core.h"
#include "virtual_camera/server/event_loop.h"

namespace vexa::camera {

VirtualCamera::VirtualCamera(CameraOptions options)
    : VirtualCamera(std::move(options), std::make_shared<EventLoop>()) {}

VirtualCamera::VirtualCamera(CameraOptions options, std::shared_ptr<EventLoop> loop)
    : loop_(std::move(loop)),
      core_(std::make_shared<CameraCore>(std::make_shared<CameraState>(std::move(options), loop_->context()))) {}

VirtualCamera::~VirtualCamera() { stop(); }

bool VirtualCamera::start() {
  error_ = loop_->run([this] { return core_->start(); });
  return error_.empty();
}

void VirtualCamera::stop() {
  loop_->run([this] { core_->stop(); });
}

void VirtualCamera::reboot(std::chrono::milliseconds away) {
  loop_->run([this, away] { core_->reboot(away); });
}

void VirtualCamera::unplug() {
  loop_->run([this] { core_->set_network(false); });
}

void VirtualCamera::plug() {
  loop_->run([this] { core_->set_network(true); });
}

void VirtualCamera::set_clock(std::chrono::system_clock::time_point time) {
  loop_->run([this, time] { core_->state()->set_clock(time); });
}

bool VirtualCamera::locked() const {
  return loop_->run([this] { return core_->state()->logins.is_locked(core_->state()->wall_clock()); });
}

const std::string& VirtualCamera::address() const { return core_->state()->options.address; }

std::uint16_t VirtualCamera::http_port() const { return core_->http_port(); }

std::uint16_t VirtualCamera::rtsp_port() const { return core_->rtsp_port(); }

std::uint16_t VirtualCamera::control_port() const { return core_->control_port(); }

std::size_t VirtualCamera::sessions() const {
  return loop_->run([this] { return core_->state()->sessions.size(); });
}

SettingsStore& VirtualCamera::settings() { return core_->state()->settings; }

AlarmScene& VirtualCamera::alarms() { return core_->state()->alarms; }

Card& VirtualCamera::card() { return core_->state()->card; }

std::optional<CameraPose> VirtualCamera::pose() const {
  const PoseSource& source = core_->state()->pose;
  return source ? std::optional<CameraPose>(source(std::chrono::steady_clock::now())) : std::nullopt;
}

PtzHead* VirtualCamera::ptz() { return core_->state()->ptz.get(); }

Journal& VirtualCamera::journal() { return core_->state()->journal; }

SentLog& VirtualCamera::sent() { return core_->state()->sent; }

const PacketisedClip* VirtualCamera::clip() const { return core_->state()->options.clip.get(); }

std::string_view VirtualCamera::control(std::string_view path, std::string_view query) {
  return loop_->run([&] { return core_->control().obey(path, query); });
}

bool VirtualCamera::plugged() const {
  return loop_->run([this] { return core_->plugged(); });
}

std::size_t VirtualCamera::viewers() const {
  return loop_->run([this] { return core_->state()->viewers(); });
}

PacketFaults VirtualCamera::packet_faults() const { return core_->state()->packet_faults.get(); }

std::size_t VirtualCamera::request_faults() const { return core_->state()->request_faults.size(); }

void VirtualCamera::add_request_fault(RequestFault fault) {
  (void)core_->state()->request_faults.add(std::move(fault));
}

void VirtualCamera::clear_request_faults() { core_->state()->request_faults.clear(); }

void VirtualCamera::set_packet_faults(PacketFaults faults) { core_->state()->packet_faults.set(std::move(faults)); }

}  // namespace vexa::camera
