// SPDX-License-Identifier: Apache-2.0
// A copy of connection settings that does not leave its password in memory.
#pragma once

#include "runtime/base/wipe.h"
#include "vexa/system_info.h"

namespace vexa {

/// Connection settings for one exchange or call.
struct PrivateConnection : SLibDConnectionInfo {
  PrivateConnection(const SLibDConnectionInfo& info) : SLibDConnectionInfo(info) {}  // NOLINT: a copy like any other
  PrivateConnection(const PrivateConnection&) = default;
  PrivateConnection& operator=(const PrivateConnection&) = delete;
  ~PrivateConnection() { wipe(password); }
};

}  // namespace vexa
