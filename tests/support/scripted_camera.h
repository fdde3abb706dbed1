// SPDX-License-Identifier: Apache-2.0
// A camera that sends the answers of a script, and complains when it receives anything else. It shares no code with the
// library, so that bytes are compared with the script, not with what the library believes.
#pragma once

#include <atomic>
#include <cstddef>
#include <functional>
#include <string>
#include <thread>
#include <vector>

#include "tests/support/own_address.h"

namespace vexa_test {

/// What becomes of a connection when its last answer is out.
enum class Then {
  kClose,  ///< the camera shuts its side down, and waits for the driver to close
  kStay,   ///< the camera falls silent, and waits for the driver to close
  kReset,  ///< the connection is torn
};

/// One request and its answer.
struct ScriptStep {
  bool new_connection = false;  ///< begins another connection; the first step always does
  /// What must be received. "{host}" and "{port}" stand for the camera's address; "{udp}" and "{udp+1}" in a
  /// client_port stand for any two neighbouring ports.
  std::string expected;
  std::string answer;
  std::size_t piece = 0;  ///< bytes sent at a time; 0: all at once
  int pause = 0;          ///< milliseconds between pieces
  Then then = Then::kClose;
  std::function<void()> meanwhile = {};  ///< done by the camera's thread between the request and the answer
};

using Script = std::vector<ScriptStep>;

/// Plays a script once, on a free port of a loopback address of this process's own.
class ScriptedCamera {
 public:
  explicit ScriptedCamera(Script script);
  ~ScriptedCamera();
  ScriptedCamera(const ScriptedCamera&) = delete;
  ScriptedCamera& operator=(const ScriptedCamera&) = delete;

  const std::string& host() const { return host_; }
  int port() const { return port_; }

  /// True once the script has been played to its end and the driver has closed its last connection.
  bool played() const { return played_; }

  /// Ends the play, wherever it is. @return what was not as written, empty when all was; a script that was not played
  /// to its end is a complaint.
  std::string finish();

 private:
  void play();
  bool play_connection(std::size_t& step);
  bool hear(int connection, const std::string& expected);
  void say(int connection, const ScriptStep& step);
  void end_connection(int connection, Then then);
  bool wait_for(int descriptor, int milliseconds);
  std::string filled_in(std::string text) const;

  Script script_;
  std::string host_;
  int port_ = 0;
  int listener_ = -1;
  int stop_[2] = {-1, -1};
  std::string complaints_;
  std::atomic<bool> played_{false};
  std::thread thread_;
};

/// A listener whose queue is full, so that connecting to it is never answered.
class FullListener {
 public:
  FullListener();
  ~FullListener();
  FullListener(const FullListener&) = delete;
  FullListener& operator=(const FullListener&) = delete;

  const std::string& host() const { return host_; }
  int port() const { return port_; }

  /// Stops listening: who still tries to connect is refused.
  void vanish();

 private:
  std::string host_;
  int port_ = 0;
  std::vector<int> sockets_;
};

/// A port of the own loopback address where nobody listens.
int refusing_port();

}  // namespace vexa_test
