// SPDX-License-Identifier: Apache-2.0
// Uses the installed library as a host does: constructs drivers, derives a model class, finds a runtime function by
// name.
#include <dlfcn.h>

#include <cstdio>
#include <memory>
#include <string>

#include "vexa/models.h"
#include "vexa/session.h"
#include "vexa/vexa.h"

namespace {

class Model : public CVexaHeronCommon {
 public:
  Model() { m_FixedCameraInfo.codecs.resize(1); }
  std::size_t codecs() const { return m_FixedCameraInfo.codecs.size(); }
};

int g_failures = 0;

void check(bool holds, const char* what) {
  if (holds) return;
  std::fprintf(stderr, "does not hold: %s\n", what);
  ++g_failures;
}

void check_driver() {
  const std::unique_ptr<CLibraryDevice> device = std::make_unique<CVexaCommon>();
  SLibDFixedSystemInfo info;
  info.maker.clear();
  check(device->GetFixedSystemInfo(info) == LIBD_OK, "GetFixedSystemInfo answers LIBD_OK");
  check(info.maker == "Vexa Corporation", "the maker is known");
  SLibDConnectionInfo connection;
  connection.host = "camera.example";
  check(device->SetCurrentConnectionInfo(connection) == LIBD_OK, "SetCurrentConnectionInfo answers LIBD_OK");
  SLibDConnectionInfo back;
  device->GetCurrentConnectionInfo(back);
  check(back.host == "camera.example", "the connection is handed back");
  check(dynamic_cast<CVexaCommon*>(device.get()) != nullptr, "the driver's type is known across the library's border");
  check(Model().codecs() == 1, "a model class fills the capability records");
  check(SLibDCameraInfo().reserved19 == 7, "records are constructed");
}

void check_models() {
  check(vexa::ProfileNames().size() >= 5, "the installed profiles are found");
  vexa::Profile profile;
  vexa::ProfileError error;
  check(vexa::LoadProfile("LMX-P200", profile, error), "an installed profile is right");
  const std::unique_ptr<CLibraryDevice> device = vexa::MakeDevice(profile);
  SLibDFixedCameraInfo video;
  check(device && device->GetFixedCameraInfo(video) == LIBD_OK && !video.codecs.empty(), "a model knows its codecs");
}

void check_sessions() {
  vexa::SessionGroupOptions without_threads;
  without_threads.threads = 0;
  vexa::SessionGroup group(without_threads);
  check(group.Descriptor() >= 0, "a group has a descriptor");
  vexa::SessionOptions options;
  options.connection.host = "127.0.0.1";
  options.connection.port = 1;
  int states = 0;
  vexa::SessionCallbacks host;
  host.state = [&states](vexa::Session&, const vexa::SessionStatus&) { ++states; };
  const auto session = group.Open(options, host);
  check(session != nullptr, "a session is opened");
  while (session && states < 2) group.Process(1000);
  check(session && session->Status().event >= 2, "a session has states");
}

void check_runtime_by_name() {
  void* const library = dlopen("libVexaCommon.so.1", RTLD_NOW | RTLD_NOLOAD);
  check(library != nullptr, "libVexaCommon.so.1 is the loaded library");
  if (library == nullptr) return;
  check(dlsym(library, "CreateEvent") == reinterpret_cast<void*>(&CreateEvent), "CreateEvent is found by its name");
  check(dlsym(library, "no_such_name") == nullptr, "what does not exist is not found");
  dlclose(library);
}

}  // namespace

int main() {
  check_driver();
  check_models();
  check_sessions();
  check_runtime_by_name();
  if (g_failures == 0) std::puts("the installed library works");
  return g_failures == 0 ? 0 : 1;
}
