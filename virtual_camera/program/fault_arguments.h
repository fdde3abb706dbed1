// SPDX-License-Identifier: Apache-2.0
// Faults as they are written on the command line.
#ifndef VIRTUAL_CAMERA_PROGRAM_FAULT_ARGUMENTS_H_
#define VIRTUAL_CAMERA_PROGRAM_FAULT_ARGUMENTS_H_

#include <CLI/CLI.hpp>
#include <list>
#include <string>
#include <utility>
#include <vector>

#include "virtual_camera/values/options.h"

namespace vexa::camera {

// Collects the fault options while the command line is parsed; `apply` then puts them into the camera's options.
class FaultArguments {
 public:
  void add_to(CLI::App& app, PacketFaults& faults);
  // Throws CLI::ValidationError, as CLI11's own checks do, for a value that cannot be read.
  void apply(CameraOptions& options) const;

 private:
  using Pairs = std::vector<std::pair<std::string, std::string>>;

  void add_packet_faults(CLI::App& app, PacketFaults& faults);
  void add_request_faults(CLI::App& app);
  void add_stream_faults(CLI::App& app);
  void apply_stream_faults(CameraOptions& options) const;

  std::vector<std::string> sequence_restarts_, timestamp_restarts_;
  // By the fault's word, in the order in which requests meet them; CLI11 keeps their addresses.
  std::list<std::pair<std::string, std::vector<std::string>>> plain_;
  std::list<std::pair<std::string, Pairs>> valued_;
  std::vector<std::string> no_part_length_;
  Pairs part_length_, before_picture_, cut_picture_, close_stream_, silence_, pause_, other_clip_;
};

}  // namespace vexa::camera

#endif  // VIRTUAL_CAMERA_PROGRAM_FAULT_ARGUMENTS_H_
