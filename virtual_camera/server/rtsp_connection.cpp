// SPDX-License-Identifier: Apache-2.0
#include "virtual_camera/server/rtsp_connection.h"

#include <fmt/format.h>

#include <algorithm>
#include <optional>
#include <utility>

#include "virtual_camera/card/card_source.h"
#include "virtual_camera/rtp/udp_port.h"
#include "virtual_camera/server/camera_state.h"
#include "virtual_camera/server/session_description.h"
#include "virtual_camera/wire/message.h"
#include "virtual_camera/wire/rtsp_message.h"

namespace vexa::camera {
namespace {

constexpr std::string_view kMethods = "Public: OPTIONS, DESCRIBE, SETUP, PLAY, GET_PARAMETER, TEARDOWN\r\n";
// Status line and fields of DESCRIBE's answer, with the longest CSeq and Content-Length.
constexpr std::size_t kDescribeHead = 120;

Answer status_only(std::string_view status, std::optional<std::uint32_t> sequence) {
  const std::string_view challenge = status.starts_with("401") ? "WWW-Authenticate: Basic realm=\"camera\"\r\n" : "";
  return rtsp_answer({status, sequence, challenge, {}});
}

bool needs_credentials(std::string_view method) { return method != "OPTIONS" && method != "TEARDOWN"; }

}  // namespace

std::size_t RtspConnection::request_size(std::string_view received) const {
  return received.starts_with('$') ? 0 : rtsp_request_size(received);
}

// A host's reports on what it receives.
std::size_t RtspConnection::passed_over(std::string_view received) const { return leading_packets_size(received); }

void RtspConnection::claim_socket(const std::function<void()>& ready) { lane_ ? lane_->claim(ready) : ready(); }

void RtspConnection::release_socket() {
  if (lane_) lane_->release();
}

Answer RtspConnection::answer(const std::string& request) {
  to_play_ = nullptr;
  const std::optional<RequestHead> head = parse_head(request);
  if (!head || !head->version.starts_with("RTSP/")) return status_only("400 Bad Request", std::nullopt);
  const std::optional<std::uint32_t> sequence = sequence_of(*head);
  if (!sequence) return status_only("400 Bad Request", std::nullopt);
  if (needs_credentials(head->method) && !state().lets_in(head->field("Authorization"))) {
    return status_only("401 Unauthorized", sequence);
  }
  return dispatch(*head, *sequence);
}

Answer RtspConnection::refuse(const std::string& request, std::string_view status) const {
  const std::optional<RequestHead> head = parse_head(request);
  return status_only(status, head ? sequence_of(*head) : std::nullopt);
}

Answer RtspConnection::dispatch(const RequestHead& request, std::uint32_t sequence) {
  if (request.method == "OPTIONS") return rtsp_answer({"200 OK", sequence, kMethods, {}});
  if (request.method == "DESCRIBE") return describe(request, sequence);
  if (request.method == "SETUP") return setup(request, sequence);
  if (request.method == "PLAY") return play(request, sequence);
  if (request.method == "GET_PARAMETER") return get_parameter(request, sequence);
  if (request.method == "TEARDOWN") return teardown(request, sequence);
  return rtsp_answer({"501 Not Implemented", sequence, kMethods, {}});
}

// Nullopt for a path that names no recording, or one without a picture.
std::optional<Recording> RtspConnection::recording_at(std::string_view path, VideoUrl as) {
  const RecordingUrl url = recording_url(path);
  if (url.kind != as) return std::nullopt;
  std::optional<Recording> recording = state().card.find(url.name);
  return recording && !recording->pictures.empty() ? recording : std::nullopt;
}

Answer RtspConnection::describe_recording(const Recording& recording, std::uint32_t sequence) {
  CameraOptions options = state().options;
  options.range_clock = clock_range(recording);
  const SourceFormat format = CardSource(state().card, recording, 1).format();
  return rtsp_answer({"200 OK", sequence, {}, describe_session(options, format, kMaxRtspAnswer - kDescribeHead)});
}

Answer RtspConnection::describe(const RequestHead& request, std::uint32_t sequence) {
  if (const auto recording = recording_at(request.path, VideoUrl::kStream)) {
    return describe_recording(*recording, sequence);
  }
  if (classify_url(request.path) != VideoUrl::kStream) return status_only("404 Not Found", sequence);
  const auto plan = state().sources.plan(video_number(request.path));
  if (!plan) return status_only("404 Not Found", sequence);
  const SourceFormat format = plan->source ? plan->source->format() : SourceFormat{};
  const std::string description = describe_session(state().options, format, kMaxRtspAnswer - kDescribeHead);
  return rtsp_answer({"200 OK", sequence, {}, description});
}

RtspConnection::MediaTransport RtspConnection::open_udp(const AskedTransport& asked) {
  asio::error_code error;
  const asio::ip::tcp::endpoint peer = socket().remote_endpoint(error);
  auto port = std::make_unique<UdpPort>(state().context);
  if (!error) error = port->open(state().options.address, {peer.address(), asked.first});
  if (error) return {};
  std::string transport = fmt::format("RTP/AVP;unicast;client_port={}-{};server_port={}-{}", asked.first, asked.second,
                                      port->number(), port->number() + 1);
  return {std::move(port), std::move(transport)};
}

// Channels that an earlier session of the connection had are not given again; the answer names those it gets.
RtspConnection::MediaTransport RtspConnection::open_interleaved(const AskedTransport& asked) {
  constexpr std::uint16_t kChannels = 256;
  const bool free = asked.first >= next_channel_;
  const std::uint16_t first = free ? asked.first : next_channel_;
  const std::uint16_t second = free ? asked.second : static_cast<std::uint16_t>(first + 1);
  if (std::max(first, second) >= kChannels) return {};
  next_channel_ = static_cast<std::uint16_t>(std::max(first, second) + 1);
  const CameraOptions& options = state().options;
  if (!lane_) {
    lane_ = std::make_shared<InterleavedLane>(
        weak_from_this(), [this] { reset(); }, socket(), options.interleaved_patience);
  }
  return {std::make_unique<InterleavedPort>(lane_, static_cast<std::uint8_t>(first)),
          fmt::format("RTP/AVP/TCP;unicast;interleaved={}-{}", first, second), options.interleaved_pause};
}

Answer RtspConnection::setup(const RequestHead& request, std::uint32_t sequence) {
  const bool found = classify_url(request.path) == VideoUrl::kTrack || recording_at(request.path, VideoUrl::kTrack);
  if (!found) return status_only("404 Not Found", sequence);
  const AskedTransport asked = asked_transport(request.field("Transport"));
  if (asked.kind == AskedTransport::Kind::kNone) return status_only("461 Unsupported Transport", sequence);
  if (state().viewers() >= state().options.max_viewers) return status_only("453 Not Enough Bandwidth", sequence);
  MediaTransport media = asked.kind == AskedTransport::Kind::kUdp ? open_udp(asked) : open_interleaved(asked);
  if (!media.port) return status_only("500 Internal Server Error", sequence);
  const auto session = std::make_shared<RtspSession>(shared_state(), state().next_session++, video_number(request.path),
                                                     std::move(media.port), media.pause);
  state().sessions[session->number()] = session;
  own_sessions_.push_back(session);
  session->touch();
  const std::string fields = fmt::format("Session: {};timeout={}\r\nTransport: {}\r\n", session->number(),
                                         state().options.session_timeout.count(), media.transport);
  return rtsp_answer({"200 OK", sequence, fields, {}});
}

std::shared_ptr<RtspSession> RtspConnection::find_session(const RequestHead& request) {
  const auto found = state().sessions.find(session_of(request));
  if (found == state().sessions.end()) return nullptr;
  found->second->touch();
  return found->second;
}

Answer RtspConnection::play(const RequestHead& request, std::uint32_t sequence) {
  const std::shared_ptr<RtspSession> session = find_session(request);
  if (!session) return status_only("454 Session Not Found", sequence);
  if (auto recording = recording_at(request.path, VideoUrl::kStream)) {
    const int scale = offered_scale(state().options.playback_scales, scale_of(request));
    session->load(std::make_unique<CardSource>(state().card, *std::move(recording), scale));
    to_play_ = session;
    const std::string fields =
        fmt::format("Session: {}\r\nScale: {}\r\nRange: npt=0.000-\r\n", session->number(), scale);
    return rtsp_answer({"200 OK", sequence, fields, {}});
  }
  if (classify_url(request.path) == VideoUrl::kNone) return status_only("404 Not Found", sequence);
  to_play_ = session;
  const std::string fields = fmt::format("Session: {}\r\nRange: npt=0.000-\r\n", session->number());
  return rtsp_answer({"200 OK", sequence, fields, {}});
}

Answer RtspConnection::get_parameter(const RequestHead& request, std::uint32_t sequence) {
  const std::shared_ptr<RtspSession> session = find_session(request);
  if (!session) return status_only("454 Session Not Found", sequence);
  return rtsp_answer({"200 OK", sequence, fmt::format("Session: {}\r\n", session->number()), {}});
}

Answer RtspConnection::teardown(const RequestHead& request, std::uint32_t sequence) {
  const std::shared_ptr<RtspSession> session = find_session(request);
  if (!session) return status_only("454 Session Not Found", sequence);
  session->end();
  return status_only("200 OK", sequence);
}

Connection::Next RtspConnection::answered() {
  if (const std::shared_ptr<RtspSession> session = std::exchange(to_play_, nullptr)) session->play();
  return Next::kReadOn;
}

bool RtspConnection::may_idle() const {
  return std::any_of(own_sessions_.begin(), own_sessions_.end(),
                     [](const std::weak_ptr<RtspSession>& session) { return !session.expired(); });
}

void RtspConnection::ended() {
  to_play_ = nullptr;
  if (lane_) lane_->close();
  for (const std::weak_ptr<RtspSession>& own : std::exchange(own_sessions_, {})) {
    if (const std::shared_ptr<RtspSession> session = own.lock()) session->end();
  }
}

}  // namespace vexa::camera
