// SPDX-License-Identifier: Apache-2.0
// Cameras that stay connected: sessions, which start a camera's streams again after whatever ended them. Of the library
// libVexaSession.
//
// A host that only wants pictures makes a SessionGroup, opens a session for each camera and is called with what comes:
//
//     vexa::SessionGroup group;
//     vexa::SessionOptions options;
//     options.connection.host = "192.168.0.100";
//     auto session = group.Open(options, callbacks);
//
// An attempt that fails is repeated after a wait that is drawn at random up to a limit of 1 s, which doubles with each
// failure up to 30 s and begins anew after 10 s of whole pictures; at once when the system reports that a link or route
// is back. Each attempt asks the camera anew for its model and its streams. Credentials that the camera refuses are not
// sent again: see Session::Retry.
//
// Which call is allowed in which callback, of the same session or of another of the same group:
//
//     call                              in any callback
//     Session::Status, Name,            returns at once
//       Statistics
//     Session::Stop, Retry,             return at once; take effect when the callback has returned. After a Stop from
//       SetCredentials                  within its callback a session makes one call more: the state kStopped
//     Session::WaitStopped              returns false at once, where waiting would never end
//     SessionGroup::Open                returns at once; the new session's first callback follows
//     SessionGroup::Metrics             returns at once
//     SessionGroup::Process             returns 0, calls nothing
//     ~SessionGroup                     not allowed: it waits for the callback
//
// No lock is held while a host's callback runs. Two threads never run callbacks of one session at once. A callback that
// takes long delays the other cameras of its thread. One that throws has ended: the exception goes no further and is
// counted (SessionMetrics::exceptions).
//
// Credentials are known by the camera's address, its port and the user name, for the whole process: of two sessions
// with different passwords for the same, the latest password is that of both. What runs keeps its credentials, and its
// keep-alives send them on; connections made anew do not send what was replaced or refused.
//
// Alarms, metadata and audio are polled on the thread that calls the host: a camera that sends the beginning of a part
// and not the rest delays the other cameras of that thread, up to its time-out. Hosts with such cameras give a group
// more threads.
//
// Sessions do not survive fork: the child has neither their threads nor their connections, and may only end or exec.
#pragma once

#include <cstddef>
#include <cstdint>
#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "vexa/export.h"
#include "vexa/io_info.h"
#include "vexa/return_codes.h"
#include "vexa/session_status.h"
#include "vexa/statistics.h"
#include "vexa/system_info.h"
#include "vexa/waiting.h"

namespace vexa {

class Session;
class SessionCore;

/// What a session is for. Copied when it is opened.
struct SessionOptions {
  /// RTSP from port 80's camera, with 5 s for each answer.
  SessionOptions() {
    connection.streamTransport = 1;
    connection.port = 80;
    connection.timeout = 5000;
  }

  std::string name;  ///< for people; empty: the camera's address
  /// Address, credentials, time-out and transport as for a driver. The password stays in memory and in no text.
  SLibDConnectionInfo connection;
  /// Profile of the camera's model, a name or a file. Empty: the installed one of the model that the camera reports,
  /// and the common driver where there is none.
  std::string profile;
  std::int32_t stream = 1;               ///< the camera's video stream, from 1
  std::uint32_t streams = kVideoStream;  ///< StreamBits: what is wanted
  /// The driver's log of its CGI requests, a file; empty: none.
  std::string cgiLog;

  std::int32_t stallMilliseconds = 4000;          ///< without a whole picture a live session is stalled
  std::int32_t giveUpMilliseconds = 12000;        ///< without a whole picture it connects anew
  std::int32_t firstPictureMilliseconds = 20000;  ///< as long as it may take from the opening to the first one
};

/// A picture. Valid until the callback has returned.
struct SessionFrame {
  std::uint32_t size = sizeof(SessionFrame);
  std::int32_t frameType = 0;  ///< as SLibDVideoFrameInfo: which codec, and whether it is a key picture
  const unsigned char* data = nullptr;
  std::size_t length = 0;    ///< bytes
  std::int32_t seconds = 0;  ///< as SLibDVideoFrameInfo; 0 where the stream has no times
  std::int32_t microseconds = 0;
  std::int64_t arrival = 0;  ///< milliseconds on CLOCK_MONOTONIC, when the session took it
  bool isFirst = false;      ///< of a connection: pictures may be missing before it
  bool isKey = false;        ///< can be decoded without those before
  /// When it was taken, by the camera's clock: microseconds since 1970, from its sender reports. 0: not known.
  std::int64_t cameraTime = 0;
};

/// What a host is called with. Each may be left empty; what it would have been called with is taken and forgotten.
struct SessionCallbacks {
  std::function<void(Session&, const SessionStatus&)> state;
  std::function<void(Session&, const SessionFrame&)> frame;
  /// Pins that a camera has reported, changed or not.
  std::function<void(Session&, const std::vector<SLibDPinInfo>&)> alarms;
  std::function<void(Session&, const SLibDRawMDFrameInfo&)> metadata;
  /// Sound as it comes from the camera; `codec` as SLibDAudioFrameInfo::codecType.
  std::function<void(Session&, const unsigned char* data, std::size_t length, std::int32_t codec)> audio;
};

/// One camera. Any thread may call any member. A host need not keep the pointer: the group does, until the session has
/// stopped.
class VEXA_API Session {
 public:
  ~Session();
  Session(const Session&) = delete;
  Session& operator=(const Session&) = delete;

  /// The state: the same as the latest event, whether the host has got that one yet or not.
  SessionStatus Status() const;
  /// Ends the session for good, whatever it is doing: returns at once, is over within a second. The last callback is
  /// the one of the state kStopped.
  void Stop();
  /// Waits until the session has stopped and its last callback has returned: true. False after `milliseconds` (less
  /// than 0: no limit), and at once on a thread that is to finish the stop itself: one that runs a callback of the
  /// group, and any thread for a group without threads, whose host calls Process instead.
  bool WaitStopped(std::int32_t milliseconds);
  /// Makes an attempt now. Refused credentials are sent once more; without this or another password no session of the
  /// process sends them again, one that is opened later included.
  void Retry();
  /// For the attempts from now on, also by other sessions of the same camera and user. What runs goes on; a stream
  /// beside its video that is lost meanwhile is started again with the next connection. When memory is short the former
  /// ones stay.
  void SetCredentials(const std::string& userName, const std::string& password);
  /// What became of each packet and frame, as GetStreamStatistics has it of a driver. The totals go on through outages;
  /// they begin anew with a camera that has become one of another model. `statistics.size` is to be set as its
  /// constructor does. False, with `statistics` as it was, before the first attempt has made a driver.
  bool Statistics(StreamStatistics& statistics) const;
  /// As in the options, or the camera's address.
  const std::string& Name() const;

 private:
  friend class SessionCore;
  explicit Session(std::shared_ptr<SessionCore> core);
  const std::shared_ptr<SessionCore> core_;
};

/// What a group costs and has done, in totals of its life.
struct SessionMetrics {
  std::uint32_t size = sizeof(SessionMetrics);
  std::uint32_t sessions = 0;         ///< now
  std::uint32_t threads = 0;          ///< now, of the group itself: those that call the host, those that connect
  std::uint32_t descriptors = 0;      ///< now, of the group itself; the drivers' connections are their own
  std::uint64_t wakeUps = 0;          ///< of the threads that call the host
  std::uint64_t longestCallback = 0;  ///< microseconds
  std::uint64_t attempts = 0;         ///< to connect
  std::uint64_t mostAttemptsAtOnce = 0;
  std::uint64_t eventsMissed = 0;     ///< states that a later one replaced before the host was called
  std::uint64_t exceptions = 0;       ///< that left a host's callback
  std::uint64_t mostTurnsWaited = 0;  ///< sessions that waited at the same time for others to have connected
  std::uint64_t mostJobsQueued = 0;   ///< openings and closings that were queued at the same time
};

/// How a group works.
struct SessionGroupOptions {
  /// Threads that call the host: each camera has one of them. 0: none; the host waits for Descriptor() and calls
  /// Process.
  std::int32_t threads = 1;
  /// Attempts to connect that are under way at the same time, from 1; others wait for their turn. Each has a thread.
  std::int32_t attempts = 8;
};

/// Sessions that share threads. Destroying it stops all of them and waits: under 5 s for 300.
class VEXA_API SessionGroup {
 public:
  explicit SessionGroup(const SessionGroupOptions& options = SessionGroupOptions());
  ~SessionGroup();
  SessionGroup(const SessionGroup&) = delete;
  SessionGroup& operator=(const SessionGroup&) = delete;

  /// Begins a session; its first attempt is made at once. Null when the group could not be made for want of memory,
  /// threads or descriptors, and in a callback while the group is being destroyed. Any thread.
  std::shared_ptr<Session> Open(const SessionOptions& options, const SessionCallbacks& callbacks);

  /// Of a group without threads: readable while there is something to do for Process. -1 for a group with threads.
  int Descriptor() const;
  /// Of a group without threads: does what is to be done and calls the host, on this thread; waits for it at most
  /// `milliseconds` (0: not at all; less: without limit). Returns how many callbacks were made. One thread at a time.
  int Process(std::int32_t milliseconds);

  SessionMetrics Metrics() const;

 private:
  class Impl;
  const std::unique_ptr<Impl> impl_;
};

}  // namespace vexa
