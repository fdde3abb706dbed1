// SPDX-License-Identifier: Apache-2.0
// The driver of one session.
#pragma once

#include <atomic>
#include <cstdint>
#include <memory>
#include <mutex>
#include <optional>
#include <string>

#include "vexa/cancel.h"
#include "vexa/models.h"
#include "vexa/session.h"
#include "vexa/statistics.h"
#include "vexa/vexa_common.h"

namespace vexa {

/// Why a line to a camera could not be opened.
struct LineFailure {
  ELibDReturnCode code = LIBD_FAILED;
  std::string text;
  bool wrong_profile = false;
};

/// One thread at a time opens, closes and takes; any may cancel.
class CameraLine {
 public:
  explicit CameraLine(const SessionOptions& options) : options_(options) {}
  ~CameraLine();
  CameraLine(const CameraLine&) = delete;
  CameraLine& operator=(const CameraLine&) = delete;

  /// Whether to give up an opening.
  class Watcher {
   public:
    [[nodiscard]] virtual bool is_cancelled() const = 0;

   protected:
    ~Watcher() = default;
  };

  /// Finds the model with the cheapest request there is, and starts the wanted streams. Nothing is open after a
  /// failure.
  [[nodiscard]] std::optional<LineFailure> open(const std::string& user, const std::string& password, Watcher& watcher);
  /// Starts one of the streams (StreamBits) other than video again, while the others run.
  [[nodiscard]] std::optional<LineFailure> start(std::uint32_t stream);
  /// Ends the streams without waiting for the camera.
  void close();
  /// Ends what waits, and what begins until the next open().
  void cancel() noexcept { token_.Cancel(); }

  /// Sends the camera its cheapest request while its streams run.
  [[nodiscard]] std::optional<LineFailure> ask();

  /// Null before the first open().
  [[nodiscard]] CVexaCommon* driver() const { return driver_; }
  [[nodiscard]] std::string latest_text() const;
  /// As SLibDAudioFrameInfo::codecType, of the sound that was started.
  [[nodiscard]] std::int32_t sound_codec() const { return sound_codec_; }
  /// Any thread. False before the first open().
  [[nodiscard]] bool statistics(StreamStatistics& statistics) const;

 private:
  [[nodiscard]] std::optional<LineFailure> identify(const SLibDConnectionInfo& connection);
  [[nodiscard]] std::optional<LineFailure> make_driver(const Profile& profile, const SLibDConnectionInfo& connection);
  void introduce(CLibraryDevice& device, const SLibDConnectionInfo& connection) const;
  [[nodiscard]] LineFailure failure(ELibDReturnCode code) const { return {code, latest_text(), false}; }

  const SessionOptions options_;
  CancelToken token_;
  mutable std::mutex mutex_;  ///< held to replace the device, and to use it on a thread of no job
  std::unique_ptr<CLibraryDevice> device_;
  CVexaCommon* driver_ = nullptr;  ///< the device
  std::int32_t sound_codec_ = -1;
  std::string model_;  ///< whose installed profile the device has; empty: none
};

}  // namespace vexa
