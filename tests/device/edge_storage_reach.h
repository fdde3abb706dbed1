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

  using CVexaCommon::_ld_is_leap_year;
  using CVexaCommon::_ld_mkgmtime;
  using CVexaCommon::CheckEdgeStorageFreeSize;
  using CVexaCommon::InitEdgeStorageKeepAlivePeriod;

  using CVexaCommon::m_ConnectionInfo;
  using CVexaCommon::m_EdgeStorageSupported;
  using CVexaCommon::m_KeepAlivePeriod;
  using CVexaCommon::m_NoTearDown;
  using CVexaCommon::m_SavedTimeout;
};

using EdgeDriver = Settings<EdgeStorageReach>;
using EdgePlay = Played<EdgeStorageReach>;

}  // namespace vexa_test
