// SPDX-License-Identifier: Apache-2.0
// What a session makes of a camera's words: a cause, and one line for a person. The first bytes of the input are the
// state, the cause and the code.
#include <string>

#include "fuzz/check.h"
#include "session/core/failure_cause.h"
#include "session/core/why_not_live.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  using vexa_fuzz::check;
  if (size < 3) return 0;
  vexa::SessionStatus status;
  status.state = static_cast<vexa::SessionState>(data[0] % 7);
  status.cause = static_cast<vexa::SessionCause>(data[1] % 17);
  status.nextAttempt = data[2];
  status.text = std::string(vexa_fuzz::text_of(data + 3, size - 3));
  const auto code = static_cast<ELibDReturnCode>(data[2]);
  static_cast<void>(vexa::is_refusal(vexa::cause_of(code, status.text)));
  const std::string why = vexa::why_not_live(status, vexa::Moment(data[1] * 100));
  check(!why.empty() && why.size() < 400 && why.back() == '.');
  for (const char letter : why) check(static_cast<unsigned char>(letter) >= ' ' && letter != 0x7f);
  return 0;
}
