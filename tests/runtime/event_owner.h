// Events that close themselves.
#pragma once

#include <memory>

#include "vexa/runtime.h"

namespace vexa_test {

struct CloseEvent {
  void operator()(typedHandle* h) const { CloseEventHandle(h); }
};
using Event = std::unique_ptr<typedHandle, CloseEvent>;

inline Event make_event() { return Event(CreateEvent(nullptr, 1, 0, nullptr)); }

}  // namespace vexa_test
