// SPDX-License-Identifier: Apache-2.0
// The calls that make a segment durable.
#pragma once

namespace vexa::node {

/// Each returns 0, or the error's number. Tests put their own in the place of the system's.
class DiskCalls {
 public:
  DiskCalls() = default;
  virtual ~DiskCalls() = default;
  DiskCalls(const DiskCalls&) = delete;
  DiskCalls& operator=(const DiskCalls&) = delete;

  virtual int sync_data(int file);
  virtual int sync(int file_or_folder);
  virtual int rename(int folder, const char* from, const char* to);
};

}  // namespace vexa::node
