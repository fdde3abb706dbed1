// SPDX-License-Identifier: Apache-2.0
// The file of a journal.
#pragma once

#include <string>
#include <utility>

namespace vexa {

/// A first line that is replaced in place, and lines that are appended after it. What the system refuses is not tried
/// again: is_kept() reports it. Written through to the system, so that it survives the process; not synced to the disk.
class GapFile {
 public:
  /// Without a path nothing is kept.
  explicit GapFile(std::string path) : path_(std::move(path)) {}
  ~GapFile();
  GapFile(const GapFile&) = delete;
  GapFile& operator=(const GapFile&) = delete;

  /// The text of a former life, empty where there is none.
  [[nodiscard]] std::string read();
  /// Replaces it, and opens it for what is appended. The former file stays until the new one is whole.
  void begin(const std::string& first, const std::string& text);
  /// As long as the first line that it replaces.
  void mark(const std::string& first);
  void append(const std::string& lines);
  [[nodiscard]] bool is_kept() const { return file_ >= 0; }

 private:
  void give_up();

  const std::string path_;
  int file_ = -1;
  long end_ = 0;
  bool unreadable_ = false;
};

}  // namespace vexa
