// The exit codes of vexactl.
#ifndef HOST_BASE_EXIT_CODE_H_
#define HOST_BASE_EXIT_CODE_H_

namespace vexa::host {

enum class ExitCode : int {
  kOk = 0,
  kUsage = 1,         // the command line, or a file it names, cannot be used
  kUnreachable = 2,   // the camera cannot be reached, does not answer, or refuses the request
  kUnauthorized = 3,  // the camera refuses user name and password
  kNoVideo = 4,       // the camera sends no picture, or has stopped sending
  kCannotWrite = 5,   // a result cannot be written
  kInterrupted = 130  // ended by Ctrl-C or a signal; what was recorded until then is kept
};

}  // namespace vexa::host

#endif  // HOST_BASE_EXIT_CODE_H_
