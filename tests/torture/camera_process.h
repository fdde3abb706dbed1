// SPDX-License-Identifier: Apache-2.0
#ifndef TESTS_TORTURE_CAMERA_PROCESS_H_
#define TESTS_TORTURE_CAMERA_PROCESS_H_

#include <sys/types.h>

namespace vexa::torture {

// A virtual camera at kCamera, in a process of its own, as its calls are not to fail. It streams small pictures.
class CameraProcess {
 public:
  // Puts a recording on its card when `with_recording`.
  CameraProcess(const char* program, bool with_recording);
  ~CameraProcess();
  CameraProcess(const CameraProcess&) = delete;
  CameraProcess& operator=(const CameraProcess&) = delete;

  [[nodiscard]] bool ready() const { return ready_; }

 private:
  pid_t process_ = -1;
  bool ready_ = false;
};

}  // namespace vexa::torture

#endif  // TESTS_TORTURE_CAMERA_PROCESS_H_
