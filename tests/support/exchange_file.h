// SPDX-License-Identifier: Apache-2.0
// Exchanges with a camera, one text file each.
//
//   timeout 100          settings of the driver, made before
//   call http_open /x    what it is asked to do
//   >>>                  the bytes it must send; ">>> another": over another connection
//   GET /x HTTP/1.0\r\n
//   <<< piece=1 pause=5 then=stay
//   HTTP/1.0 200 OK\r\n  the camera's answer, and how it is given (close, stay or reset after it)
//   ===
//   result 1             what must come of it
//
// Bytes stand as they are; the line ends of the file do not count, "\r", "\n", "\\" and "\x00" stand for bytes. Lines
// that begin with "#" describe what is odd. What another file of the folder has already:
//
//   after live_session 2    that file's first 2 requests and answers come first
//   >>> as live_session     its request at the same place; "<<< as live_session" its answer
//   === as live_session     its results, but for those that follow
#pragma once

#include <map>
#include <string>
#include <vector>

#include "tests/support/scripted_camera.h"

namespace vexa_test {

struct ExchangeFile {
  std::map<std::string, std::string> before;
  Script script;
  std::map<std::string, std::string> results;
};

/// Reads a file; throws when it is not written as above, or has a key that no test knows.
ExchangeFile read_exchange(const std::string& path);

/// The names of the exchange files in a folder, sorted, without ".txt".
std::vector<std::string> exchange_names(const std::string& folder);

}  // namespace vexa_test
