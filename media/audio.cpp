// Sound from the camera.
#include "runtime/base/sync.h"
#include "vexa/vexa_common.h"

ELibDReturnCode CVexaCommon::StopAudioStreaming() {
  const vexa::Guard guard(m_AudioLock);
  if (m_AudioSocket != -1) http_close(m_AudioSocket);
  m_AudioSocket = -1;
  return LIBD_OK;
}
