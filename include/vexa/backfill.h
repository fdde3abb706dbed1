// SPDX-License-Identifier: Apache-2.0
// Outages made good: what a camera's card has recorded while a session had no pictures. Of the library libVexaSession.
//
//     vexa::Backfill backfill(options, backfillOptions, backfillCallbacks);  // outlives the session
//     auto session = group.Open(options, backfill.Watch(callbacks));
//
// A gap is the time between two pictures of a session that an outage lies between. When pictures come again it is
// fetched: one playback a camera, on a connection of its own, the oldest gap first, which is also what a card that is
// full overwrites first; only while the session is live. A recording that the camera has not finished is waited for.
//
// The gap is in the host's time, the card's recordings are in the camera's. Where the camera sends RTCP sender reports,
// both edges are known by its clock to the picture. Otherwise more is asked for, by what is not known of its clock, and
// cut where its pictures are those that came live; else by time. Pictures come in their order, each once; a playback
// that breaks, or in which packets are lost, is begun again and goes on after its last picture.
//
// A camera whose clock has jumped, for instance to 1970 when its power failed, has recordings on two clocks: each is
// placed by the clock that shows it within the gap. Recordings that were not on the card before and lie in no gap by
// either are taken for the oldest gap, and their times are counted from where the others end.
//
// The journal, a file, keeps gaps and how far each has been fetched. A host that is started again goes on there; one
// that was killed has a gap from its last picture on. A host that is killed within a callback gets that one picture
// again, no other.
#pragma once

#include <cstddef>
#include <cstdint>
#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "vexa/export.h"
#include "vexa/session.h"

namespace vexa {

/// What has become of a gap.
enum class GapState : std::int32_t {
  kOpen = 0,         ///< the outage goes on
  kDue = 1,          ///< to be fetched, or being fetched
  kRecovered = 2,    ///< all of it has been delivered
  kPartial = 3,      ///< the card lacks the stretches of Gap::missing
  kAbsent = 4,       ///< the card has recorded none of it
  kOverwritten = 5,  ///< the card had recorded it, and holds it no more
  kRefused = 6       ///< the camera does not list or play its recordings: see Gap::text
};

/// A part of a gap: microseconds since 1970 by the host's clock.
struct GapStretch {
  std::int64_t begin = 0;
  std::int64_t end = 0;
};

struct Gap {
  std::uint32_t size = sizeof(Gap);
  GapState state = GapState::kOpen;
  std::uint64_t number = 0;         ///< in the journal, from 1
  std::int64_t begin = 0;           ///< the last picture before it: microseconds since 1970 by the host's clock
  std::int64_t end = 0;             ///< the first picture after it; 0 while it is open
  std::int64_t cameraBegin = 0;     ///< the same by the camera's clock as it was before; 0: not known
  std::int64_t cameraEnd = 0;       ///< and as it was after; 0: not known
  std::uint64_t pictures = 0;       ///< delivered, without those that only lead in
  std::vector<GapStretch> missing;  ///< of kPartial: pauses of more than a second
  std::string text;                 ///< of kRefused: the camera's reason
};

/// A recorded picture. Valid until the callback has returned.
struct BackfillFrame {
  std::uint32_t size = sizeof(BackfillFrame);
  std::int32_t frameType = 0;  ///< as SLibDVideoFrameInfo
  const unsigned char* data = nullptr;
  std::size_t length = 0;       ///< bytes
  std::uint64_t gap = 0;        ///< Gap::number
  std::int64_t time = 0;        ///< microseconds since 1970 by the host's clock, as far as the camera's is known
  std::int64_t cameraTime = 0;  ///< the same by the camera's, as recorded
  bool isKey = false;           ///< can be decoded without those before
  bool isFirst = false;         ///< of a playback: pictures may be missing before it
  bool leadsIn = false;         ///< lies before what is to be delivered, and is there to decode it; may come repeatedly
};

struct BackfillCallbacks {
  /// A picture of a gap, on a thread of this object.
  std::function<void(const BackfillFrame&)> frame;
  /// A gap has another state. Of kOpen and kDue on the thread that calls the session's host, else as `frame`.
  std::function<void(const Gap&)> gap;
};

struct BackfillOptions {
  std::string journal;  ///< a file, of one camera; empty: gaps are forgotten with this object
  /// How far the clock of a camera without sender reports may be from the host's, beside `clockOffsetMilliseconds`.
  std::int32_t clockUncertaintyMilliseconds = 2000;
  std::int64_t clockOffsetMilliseconds = 0;  ///< of such a camera: its clock less the host's, as far as it is known
  std::int32_t scale = 1;                    ///< pace of the playback, from 1, as the camera offers it
  /// Of fetched pictures, on average from one recording to the next; 0: no bound. A playback has the camera's pace.
  std::uint64_t bytesPerSecond = 0;
  std::int32_t silenceMilliseconds = 5000;  ///< without a picture a playback is broken
};

/// The gaps of one camera. Has a thread of its own while there is one to fetch. No lock is held while the host is
/// called; an exception of a callback goes no further. Any thread may call any member. The destructor ends what the
/// thread does and waits for it, up to a second beside a callback that runs; it is not to be called in one.
class VEXA_API Backfill {
 public:
  /// Of the camera that the session's options name, with its credentials, profile and time-out.
  Backfill(const SessionOptions& camera, const BackfillOptions& options, const BackfillCallbacks& callbacks);
  ~Backfill();
  Backfill(const Backfill&) = delete;
  Backfill& operator=(const Backfill&) = delete;

  /// The callbacks to open the camera's session with: those given, which are called as before, and this object's own.
  /// It has to outlive that session.
  SessionCallbacks Watch(const SessionCallbacks& host);

  /// All gaps of the journal that are not over, and those that ended since this object was made; by their number.
  std::vector<Gap> Gaps() const;
  /// Whether the journal could be read and can be written; without one gaps are fetched all the same, and forgotten.
  bool JournalIsKept() const;

 private:
  class Impl;
  const std::shared_ptr<Impl> impl_;
};

}  // namespace vexa
