// SPDX-License-Identifier: Apache-2.0
// Pins and detection in the words of the command line.
#ifndef HOST_WORDS_ALARM_WORDS_H_
#define HOST_WORDS_ALARM_WORDS_H_

#include <map>
#include <string>
#include <utility>
#include <vector>

#include "vexa/io_info.h"

namespace vexa::host {

// "input", "output", "motion", "tampering" or "audio".
[[nodiscard]] std::string kind_of(const SLibDPinInfo& pin);

// Remembers the states of pins and returns those of a status call that have changed. A pin not seen before counts as
// inactive.
class PinStates {
 public:
  [[nodiscard]] std::vector<SLibDPinInfo> changed(const std::vector<SLibDPinInfo>& pins);

 private:
  std::map<std::pair<int, int>, int> states_;  // by type and number
};

enum class WatchFormat { kText, kJson };

// One line of `vexactl watch`, with its line end.
[[nodiscard]] std::string alarm_line(const SLibDPinInfo& pin, const std::string& moment, WatchFormat format);
[[nodiscard]] std::string metadata_line(const SLibDRawMDFrameInfo& frame, const std::string& moment,
                                        WatchFormat format);

}  // namespace vexa::host

#endif  // HOST_WORDS_ALARM_WORDS_H_
