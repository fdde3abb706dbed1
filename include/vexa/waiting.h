// Waiting for what a driver has for its host, in place of asking again and again.
//
// A driver has four streams to take from: video, alarms, motion metadata and audio. A stream is ready while there is
// something to take from it, and when its poll has a silence of the camera to report; a loop that only waits therefore
// misses no camera that has died. All descriptors here are level-triggered: readable as long as something is ready. For
// `poll`, `epoll` and any loop on top of them:
//
//   - Wait until the descriptor is readable, then take until the poll returns LIBD_NO_FRAME.
//   - Never read, write or close the descriptor. The driver makes it when it is first asked for and closes it.
//   - A descriptor may be readable although nothing is left to take: another thread was faster, or the report is over.
//   - Descriptors are close-on-exec. A child made by fork may only end or exec: it must neither read the descriptors
//   nor
//     use or destroy drivers and wait sets, whose threads it does not have.
//   - Remove a driver's descriptor from the loop before the driver is destroyed. What still polls it afterwards meets
//   no
//     memory of the driver: a poll under way sleeps until its own time-out, epoll forgets the descriptor by itself, and
//     a later poll reports POLLNVAL, until the system gives the number to another file. A WaitSet forgets a destroyed
//     driver by itself.
//
// Any thread may call any function, while streams start and stop too, for a driver that is not being destroyed. A
// driver that is never asked costs nothing. Nothing is thrown, and the driver's latest error stays as it is.
#pragma once

#include <cstdint>
#include <memory>
#include <vector>

#include "vexa/export.h"

class CVexaCommon;

namespace vexa {

class WaitGroup;

/// The streams of a driver, one bit each, with the operation that takes from it.
enum StreamBits : std::uint32_t {
  kVideoStream = 1U << 0,     ///< GetCurrentVideoFrame
  kAlarmStream = 1U << 1,     ///< GetCurrentIoStatus
  kMetadataStream = 1U << 2,  ///< GetCurrentPosition(SLibDRawMDFrameInfo&)
  kAudioStream = 1U << 3,     ///< GetCurrentAudioFrame
  kAllStreams = kVideoStream | kAlarmStream | kMetadataStream | kAudioStream
};

/// Returned where a descriptor or a number is expected; all are below 0. A later call tries again.
enum WaitingFailure : std::int32_t {
  kNoDescriptorLeft = -1,  ///< the process or the system has no descriptor left (EMFILE, ENFILE)
  kNoMemoryLeft = -2
};

/// A descriptor that is readable while GetCurrentVideoFrame returns anything but LIBD_NO_FRAME: a frame, or
/// LIBD_TIMEOUT for a silent camera. The number stays the same until the driver is destroyed, across starts and stops
/// of video; it is not readable while no video plays. Also right when frames wait already. A WaitingFailure when it
/// cannot be made.
///
/// It becomes readable by one system call when the queue of frames is no longer empty, and unreadable by another when
/// the last frame has been taken; frames in between cost none.
VEXA_API int VideoFrameDescriptor(CVexaCommon& driver);

/// Waits until GetCurrentVideoFrame would return anything but LIBD_NO_FRAME: true; false when `milliseconds` have
/// passed before. 0 looks once, less waits without limit. Needs no descriptor. A stop of video does not end the wait:
/// it goes on for the next stream. Several threads may wait; all of them wake, and one gets the frame. Not from within
/// a CDataSink.
VEXA_API bool WaitForVideoFrame(CVexaCommon& driver, int milliseconds);

/// Which of the wanted streams (StreamBits) are ready now. Does not wait. A stream that is not started is never ready.
///
/// Alarms, metadata and audio are ready while bytes of the camera wait on their connection, alarms also right after
/// StartIoStreaming, whose answer holds the first states. Their polls wait for the rest of a part that has arrived in
/// pieces, as ever. After a poll without data, and when the camera has closed the connection, the stream is ready once
/// a second; a silence that has been reported is reported again after as long a silence.
VEXA_API std::uint32_t ReadyStreams(CVexaCommon& driver, std::uint32_t wanted = kAllStreams);

/// Lets a frame of RTP video reach the host sooner, for more wake-ups of the streaming thread. As it is, the thread
/// lets datagrams gather for up to 2 ms while a picture arrives, which saves most of its wake-ups; a prompt one waits
/// no longer than 0.25 ms. Off in a new driver. Holds from the next datagram on and for later streams.
VEXA_API void SetPromptFrames(CVexaCommon& driver, bool prompt);

/// A driver of a WaitSet, and which of its streams are ready.
struct ReadyDriver {
  CVexaCommon* driver;
  std::uint32_t streams;  ///< StreamBits, at least one
};

/// One descriptor for the streams of many drivers: three descriptors a set, however many drivers it has, and not one
/// for a driver. A driver may be in several sets.
///
/// The host keeps the drivers; one that is destroyed leaves its sets. A set may be destroyed while its drivers stream,
/// but not while another thread uses it. Several threads may wait for one set, and are all given what is ready.
class VEXA_API WaitSet {
 public:
  WaitSet();
  ~WaitSet();
  WaitSet(const WaitSet&) = delete;
  WaitSet& operator=(const WaitSet&) = delete;

  /// From here on the set is ready when one of these streams (StreamBits) of the driver is; for a driver that is in the
  /// set already the streams are replaced. Streams need not be started yet. False when memory or descriptors have run
  /// out: the set is as it was.
  bool Add(CVexaCommon& driver, std::uint32_t streams = kVideoStream);
  /// A driver that is not in the set is passed over. A Wait under way may still return it.
  void Remove(CVexaCommon& driver);

  /// Readable while a stream of the set is ready, for a loop of the host's, which then calls Wait with 0. The number
  /// stays the same until the set is destroyed. A WaitingFailure when it cannot be made.
  int Descriptor();

  /// Waits until a stream of the set is ready, at most `milliseconds`; 0 looks once, less waits without limit. `ready`
  /// is replaced by the drivers with something to take, each once, in no order: their number is returned, 0 when the
  /// time has passed. A driver is returned again until its host has taken what there is. A WaitingFailure when there is
  /// no descriptor or no memory for the answer.
  int Wait(std::vector<ReadyDriver>& ready, int milliseconds);

 private:
  std::shared_ptr<WaitGroup> group_;  ///< shared with the drivers in the set; null when memory was short
};

}  // namespace vexa
