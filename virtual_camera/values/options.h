// SPDX-License-Identifier: Apache-2.0
// The options of one virtual camera, set before it starts.
#ifndef VIRTUAL_CAMERA_VALUES_OPTIONS_H_
#define VIRTUAL_CAMERA_VALUES_OPTIONS_H_

#include <chrono>
#include <cstddef>
#include <cstdint>
#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "virtual_camera/values/faults.h"
#include "virtual_camera/values/sender_reports.h"

namespace vexa::camera {

// Which sensors and detectors a camera has.
struct AlarmLayout {
  int inputs = 2;
  std::string detection = "object";  // "object", "motion" (both by window), "lod" (one item); empty: none
  bool tampering = true;
  bool audio = true;
};

class ImageClip;
class PacketisedClip;
class SettingRules;

// How pictures are made as streams are set: drawn squares, which cost no time, or the scene before the camera, painted
// and encoded as they are sent. Builds without encoders draw.
enum class PicturesMade { kDrawn, kOfTheScene };

enum class SessionExpiry { kNever, kWhenSilent };

struct CameraOptions {
  std::string address = "127.0.0.2";
  std::uint16_t http_port = 0;    // 0: any free port
  std::uint16_t rtsp_port = 554;  // 0: any free port
  std::string user = "admin";     // user and password both empty: everyone is let in
  std::string password = "admin";

  // So many requests with wrong credentials in a row lock the camera for 30 minutes of its own clock; 0: none do.
  unsigned lock_after = 0;

  // The camera model: a profile file, or one already loaded, which wins. It decides which settings the camera has and
  // takes, and what it streams where no clip is given. With neither, the camera takes every setting.
  std::string profile_path;
  std::shared_ptr<const SettingRules> profile;
  PicturesMade pictures_made = PicturesMade::kDrawn;

  // The clip to stream over RTP: a file (".h264", else ".m4v" or ".mjpeg", as ImageClip has it), or one already loaded,
  // which wins and can be shared by many cameras. With neither, sessions open but carry no picture.
  std::string clip_path;
  std::shared_ptr<const PacketisedClip> clip;
  bool loop = true;            // start the clip over at its end
  std::uint64_t pictures = 0;  // end the stream after this many pictures; 0: no such end

  // What "/image1", "/image2" ... stream over HTTP: a file of JPEG, H.264 or MPEG-4 pictures, or one already loaded,
  // which wins. With neither, there is no such stream.
  std::string image_path;
  std::shared_ptr<const ImageClip> images;
  std::string sound_path;  // "/audio" streams this file with the codec's word after it: "tone" means "tone.g711_64" ...
  std::string user_data;   // in every picture over HTTP and in key pictures over RTP, such as "CamPos: ..."
  std::size_t stream_piece = 0;  // bytes of an HTTP stream that leave at a time; 0: a picture at once
  std::vector<HttpStreamFault> stream_faults;

  // Sensors and detectors; a profile's win. With a control port (0: any free one) things can be made to happen around
  // the camera, from this machine alone.
  AlarmLayout alarms;
  bool control = false;
  std::uint16_t control_port = 0;

  // The card in the slot, on which the camera records while its network is away; 0 bytes: the slot is empty.
  std::uint64_t card_bytes = 0;
  std::vector<int> playback_scales = {1, 2, 4, -1};  // at which recordings are played; another is taken to the nearest

  double frames_per_second = 25;
  double speed = 1;  // pace: 4 sends four times faster, with timestamps advancing by picture as at 1
  // Asked on the camera's thread before each picture of a stream leaves; while it returns true the stream pauses,
  // and goes on at its pace from there. For hosts in the same process, which must not lose a picture on a machine that
  // is slow for a moment. Empty: never held.
  std::function<bool()> hold_pictures;
  double ptz_speed = 1;  // pace of pan, tilt, zoom, focus and tours, on top of the pace of all
  std::uint32_t clock_rate = 90000;
  std::uint16_t start_sequence = 1;
  std::uint32_t start_timestamp = 100000000;
  std::uint8_t payload_type = 96;  // JPEG always has 26
  std::size_t max_payload = 1400;  // RTP payload bytes of one datagram, at least 3
  // A picture goes out in bursts of at most this many packets, spread over half the picture's time.
  std::size_t burst_packets = 16;
  std::chrono::microseconds burst_gap{200};  // least pause between two bursts of one session, also when late
  // Mbit/s of the camera's network port: above 0, a picture's datagrams leave one by one at its rate instead of in
  // bursts, as they reach a host from a camera behind a 100 Mbit/s port.
  unsigned link_megabits = 0;

  // Packets on the RTSP connection begin so long after PLAY's answer: hosts take an answer off the connection together
  // with what has come after it.
  std::chrono::milliseconds interleaved_pause{250};
  // A host that takes none of them for so long has its connection reset.
  std::chrono::milliseconds interleaved_patience{10000};

  std::string range_clock;  // for instance "20240131T235959.250Z": adds the range line to the session description
  std::uint32_t first_session = 12345678;    // numbers of later sessions count up from it
  std::size_t max_viewers = 256;             // RTSP sessions and picture streams over HTTP at once; more are refused
  std::chrono::seconds session_timeout{60};  // as advertised
  SessionExpiry session_expiry = SessionExpiry::kNever;
  std::chrono::milliseconds request_time_limit{10000};  // for a request begun; then the connection is closed

  std::uint64_t seed = 1;
  PacketFaults packet_faults;
  SenderReports sender_reports;  // to the port after the host's media port, or on the channel after it
  std::vector<RequestFault> request_faults;

  std::size_t journal_limit = 100000;    // requests kept
  std::size_t sent_log_limit = 1000000;  // packets kept; 0 keeps none
  bool hash_packets = true;              // fill SentPacket::hash
};

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_VALUES_OPTIONS_H_
