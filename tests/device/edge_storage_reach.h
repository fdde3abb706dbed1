// The driver's edge storage in reach, as a model with a card sets it up.
#pragma once

#include "tests/device/settings_exchange.h"

namespace vexa_test {

class EdgeStorageReach : public CVexaCommon {
 public:
  EdgeStorageReach() {
    m_EdgeStorageSupported = true;
    m_SavedTimeout = kPatientTimeout;
  }
};

using EdgeDriver = Settings<EdgeStorageReach>;
using EdgePlay = Played<EdgeStorageReach>;

}  // namespace vexa_test
