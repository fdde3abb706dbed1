#include <vexa/session.h>

#include <fstream>
#include <iostream>

// Keeps a camera's pictures, whatever becomes of the camera and its network, until Enter is pressed.
int main(int argc, char** argv) {
  std::ofstream file("live.h264", std::ios::binary);
  vexa::SessionCallbacks host;
  host.state = [](vexa::Session& camera, const vexa::SessionStatus& status) {
    std::cout << camera.Name() << ": " << status.why << std::endl;
  };
  host.frame = [&file](vexa::Session&, const vexa::SessionFrame& frame) {
    file.write(reinterpret_cast<const char*>(frame.data), static_cast<std::streamsize>(frame.length));
  };
  vexa::SessionOptions options;
  options.connection.host = argc > 1 ? argv[1] : "192.168.0.100";
  options.connection.userName = "admin";
  options.connection.password = "admin";
  vexa::SessionGroup cameras;
  if (!cameras.Open(options, host)) return 1;
  std::cin.get();
  return 0;
}
