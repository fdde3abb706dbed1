// SPDX-License-Identifier: Apache-2.0
// A journal as a file: one JSON object a line.
#ifndef VIRTUAL_CAMERA_PROGRAM_JOURNAL_FILE_H_
#define VIRTUAL_CAMERA_PROGRAM_JOURNAL_FILE_H_

#include <fstream>
#include <mutex>
#include <string>

#include "virtual_camera/server/journal.h"

namespace vexa::camera {

// {"camera":...,"kind":"http"|"rtsp","peer":...,"time":seconds,"status":...,"request":...,"answer":...}
// Requests and answers are bytes, not text: each byte becomes the character of its number, so none is lost.
[[nodiscard]] std::string journal_line(const std::string& camera, const Request& request);

// Owned by the program. Thread-safe: several threads may serve its cameras. Each line is on disk before the answer
// leaves.
class JournalFile {
 public:
  explicit JournalFile(const std::string& path) : file_(path, std::ios::trunc) {}

  [[nodiscard]] bool good() const { return file_.good(); }
  void add(const std::string& camera, const Request& request);

 private:
  std::mutex mutex_;
  std::ofstream file_;
};

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_PROGRAM_JOURNAL_FILE_H_
