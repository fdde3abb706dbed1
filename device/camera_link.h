// SPDX-License-Identifier: Apache-2.0
// What members reach the camera with: the shared connection settings, the CGI log, one request at a time.
#pragma once

#include <atomic>
#include <map>
#include <span>
#include <string>

#include "device/error_record.h"
#include "device/exchange_ledger.h"
#include "device/flight_recorder.h"
#include "runtime/base/sync.h"
#include "transport/http_exchange.h"
#include "vexa/file_logger.h"
#include "vexa/system_info.h"

namespace vexa {

/// Raises the connection's time-out for as long as a slow request takes; the saved one is put back at its end.
///
/// Kept: it stands in the shared settings, so requests of other threads have it too meanwhile; of two that overlap, the
/// first to end puts the saved time-out back for both.
class RaisedTimeout {
 public:
  RaisedTimeout(int& timeout, int& saved, CSimpleLock& lock, int milliseconds);
  ~RaisedTimeout();
  RaisedTimeout(const RaisedTimeout&) = delete;
  RaisedTimeout& operator=(const RaisedTimeout&) = delete;

 private:
  CSimpleLock& lock_;
  int& timeout_ VEXA_GUARDED_BY(lock_);
  const int restored_;
};

/// The connection settings, which are fields of the driver. Owned by DriverState; any thread. Hands out copies, never
/// references, so that no exchange sees a setting change.
class Connection {
 public:
  Connection(SLibDConnectionInfo& info, int& saved_timeout, CSimpleLock& lock)
      : lock_(lock), info_(info), saved_timeout_(saved_timeout) {}

  PrivateConnection copy();
  int timeout();
  /// Writes "HOST:PORT", cut where it does not fit.
  void write_name(std::span<char> room);
  /// The time-out is `milliseconds` for the life of what this returns.
  RaisedTimeout raised(int milliseconds) VEXA_EXCLUDES(lock_);

 private:
  CSimpleLock& lock_;
  SLibDConnectionInfo& info_ VEXA_GUARDED_BY(lock_);
  int& saved_timeout_ VEXA_GUARDED_BY(lock_);
};

/// Writes the CGI log while it is switched on, and gives the same and more to the flight recorder. Owned by
/// DriverState; any thread. Never fails: a line that cannot be written is lost.
class CgiLog final : public ExchangeLog {
 public:
  CgiLog(CFileLogger& file, const std::atomic<bool>& enabled, FlightRecorder& recorder)
      : file_(file), enabled_(enabled), recorder_(recorder) {}

  bool is_on() const override { return enabled_ || recorder_.is_on(); }
  void write(const char* direction, const char* message) override;
  /// A line of the log, whether or not it is switched on.
  void enter(const char* direction, const char* message);
  /// What the recorder alone keeps: an answer's body, and why there is none.
  void note_body(const std::string& body) { recorder_.note("http <", body); }
  void note_failure(const Failure& failure) { recorder_.note("http !", failure.text); }

 private:
  CFileLogger& file_;
  const std::atomic<bool>& enabled_;
  FlightRecorder& recorder_;
};

/// Sends requests and inquiries, and records why one failed. Owned by DriverState; any thread. A request blocks for the
/// connection's time-out at most three times, an inquiry four times. Never reads the latest error back.
class CameraLink {
 public:
  CameraLink(Connection& connection, CgiLog& log, ErrorRecord& errors, ExchangeLedger& exchanges,
             const std::map<std::string, int>& inquiry_sizes)
      : connection_(connection), log_(log), errors_(errors), exchanges_(exchanges), inquiry_sizes_(inquiry_sizes) {}

  /// Requests a path; a new exchange begins. A failure is recorded by the member that asks, not here.
  Result<Socket> open(const std::string& path);

  /// One request whose answer is not read: LIBD_OK, or the code of its own failure.
  ELibDReturnCode send(const char* format, ...) __attribute__((format(printf, 2, 3)));

  /// One inquiry; a failure leaves `answer`. An inquiry that is not known is LIBD_FAILED, and nothing is sent.
  ELibDReturnCode inquire(const std::string& name, std::string& answer);

 private:
  HttpPeer peer();

  Connection& connection_;
  CgiLog& log_;
  ErrorRecord& errors_;
  ExchangeLedger& exchanges_;
  const std::map<std::string, int>& inquiry_sizes_;
};

}  // namespace vexa
