// CVexaCommon: the camera-position text that cameras put into a picture's user data.
#include "media/assembly/camera_position.h"
#include "runtime/base/sync.h"
#include "vexa/vexa_common.h"

bool CVexaCommon::GetUserDataFromStream(const unsigned char* data, unsigned int length) {
  const vexa::Bytes front = vexa::front_of_user_data({data, length});
  return TakeCameraPosition(front.data(), static_cast<unsigned int>(front.size()));
}

bool CVexaCommon::TakeCameraPosition(const unsigned char* data, unsigned int length) {
  const auto position = vexa::camera_position({data, length});
  if (!position) return false;
  const vexa::Guard guard(m_CamPosLock);
  m_CamPosText = *position;
  return true;
}
