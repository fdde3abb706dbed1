// SPDX-License-Identifier: Apache-2.0
#include "tests/chaos/cameras.h"

#include <chrono>

#include "tests/support/own_address.h"
#include "virtual_camera/codec/rtp_packetiser.h"

namespace vexa_test {
namespace {

using std::chrono::milliseconds;
using vexa::camera::PacketFaults;
using vexa::camera::RequestFault;

vexa::camera::CameraOptions options_of(unsigned index) {
  vexa::camera::CameraOptions options;
  options.address = own_loopback(index + 1);
  options.clip_path = VEXA_CLIPS "/small.h264";
  options.image_path = VEXA_CLIPS "/small.h264";
  options.sound_path = VEXA_CLIPS "/tone";
  options.sender_reports.every = 5;
  options.seed = index;
  // Of a run of hours neither is kept.
  options.journal_limit = 1000;
  options.sent_log_limit = 0;
  return options;
}

// Requests that are not TEARDOWN, whose answer a stop awaits for 15 s.
RequestFault request_fault(std::mt19937& random) {
  constexpr const char* kRequests[] = {"inq=camera", "inq=",      "DESCRIBE", "SETUP",
                                       "PLAY",       "alarmdata", "mddata",   "image"};
  const std::string match = kRequests[random() % std::size(kRequests)];
  switch (random() % 8) {
    case 0:
      return RequestFault::no_answer(match);
    case 1:
      return RequestFault::slow(match, milliseconds(random() % 200));
    case 2:
      return RequestFault::byte_at_a_time(match, milliseconds(1));
    case 3:
      return RequestFault::cut_after(match, random() % 60);
    case 4:
      return RequestFault::reset(match);
    case 5:
      return RequestFault::status(match, "503 Service Unavailable");
    case 6:
      return RequestFault::raw(match, "\r\n\r\n");
    default:
      return RequestFault::wrong_credentials(match);
  }
}

PacketFaults packet_faults(std::mt19937& random) {
  PacketFaults faults;
  faults.loss = static_cast<double>(random() % 4) / 100;
  faults.reorder = static_cast<double>(random() % 4) / 100;
  faults.duplicate = static_cast<double>(random() % 4) / 100;
  if (random() % 4 == 0) faults.sequence_restarts.push_back({random() % 50, {}});
  if (random() % 4 == 0) faults.timestamp_restarts.push_back({random() % 50, {}});
  return faults;
}

}  // namespace

ChaosCameras::ChaosCameras() {
  for (unsigned i = 0; i < kCount; ++i) cameras_.emplace_back(options_of(i));
}

bool ChaosCameras::start() {
  for (auto& camera : cameras_) {
    if (!camera.start()) return false;
  }
  for (const std::string& picture : cameras_[0].clip()->images().pictures()) pictures_.insert(picture);
  return true;
}

void ChaosCameras::change(std::mt19937& random) {
  const std::size_t index = random() % kCount;
  vexa::camera::VirtualCamera& camera = at(index);
  switch (random() % 8) {
    case 0:
    case 1:
      return camera.add_request_fault(request_fault(random));
    case 2:
    case 3:
      return camera.clear_request_faults();
    case 4:
    case 5:
      return camera.set_packet_faults(packet_faults(random));
    case 6:
      return camera.reboot(milliseconds(random() % 100));
    default:
      if (unplugged_[index]) {
        camera.plug();
      } else {
        camera.unplug();
      }
      unplugged_[index] = !unplugged_[index];
  }
}

void ChaosCameras::heal() {
  for (std::size_t i = 0; i < kCount; ++i) {
    at(i).clear_request_faults();
    at(i).set_packet_faults({});
    if (unplugged_[i]) at(i).plug();
    unplugged_[i] = false;
  }
}

}  // namespace vexa_test
