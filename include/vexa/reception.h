// Whose packets a driver takes.
#pragma once

#include "vexa/export.h"

class CVexaCommon;

namespace vexa {

/// Strict reception: of RTP over UDP only packets from the camera's address are taken, and, once the first of them has
/// come, only those of its SSRC until the next start. What is refused is counted (StreamStatistics,
/// packetsDiscardedForeignSource and packetsDiscardedForeignSsrc). Off by default: any sender's packets are taken, as
/// cameras behind address translation need. Any thread; holds from the next picture on, of this start and later ones.
VEXA_API void SetStrictReception(CVexaCommon& driver, bool on);

}  // namespace vexa
