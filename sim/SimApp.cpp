#include "SimApp.h"

#include <malloc.h>

#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <sstream>

#include "SimCommandProcessor.h"
#include "SimConfigLoader.h"
#include "SimPortMapperClient.h"
#include "SimServer.h"
#include "SimSteadyClock.h"

extern const char* const kSimDefaultConfigText;

namespace {

int Fail(const Dstring& message) {
  std::fprintf(stderr, "qensim: %s\n", message.c_str());
  return 1;
}

bool ReadFile(const Dstring& path, Dstring& text) {
  std::ifstream in(path, std::ios::binary);
  if (!in) return false;
  std::ostringstream content;
  content << in.rdbuf();
  text = content.str();
  return !in.bad();
}

// $XDG_DATA_HOME/qensim, else ~/.local/share/qensim.
Dstring DefaultDataDir() {
  const char* xdg = std::getenv("XDG_DATA_HOME");
  if (xdg != nullptr && *xdg != '\0') return Dstring(xdg) + "/qensim";
  const char* home = std::getenv("HOME");
  return Dstring(home != nullptr ? home : ".") + "/.local/share/qensim";
}

}  // namespace

int SimApp::Run(const SimOptions& options) {
#ifdef M_MMAP_THRESHOLD
  // A data block passes through buffers of up to 16 MiB each message: they are reused from
  // the heap instead of being mapped, faulted in and unmapped every time.
  mallopt(M_MMAP_THRESHOLD, 64 * 1024 * 1024);
  mallopt(M_TRIM_THRESHOLD, 128 * 1024 * 1024);
#endif
  Dstring config = kSimDefaultConfigText;
  if (!options.mConfigPath.empty() && !ReadFile(options.mConfigPath, config)) {
    return Fail("cannot read " + options.mConfigPath);
  }
  SimParamTable params;
  ConditionList list;
  if (SimConfigLoader::Load(config, params, list) != 0) return Fail(list.ToText());

  Dstring dataDir = options.mDataDir.empty() ? DefaultDataDir() : options.mDataDir;
  std::error_code error;
  std::filesystem::create_directories(dataDir.c_str(), error);
  if (error) {
    // Nothing needs the data directory yet; only one asked for by name must exist.
    if (!options.mDataDir.empty()) return Fail("cannot create " + dataDir + ": " + error.message());
    if (!options.mQuiet)
      std::fprintf(stderr, "qensim: cannot create %s: %s\n", dataDir.c_str(), error.message().c_str());
  }

  SimSteadyClock clock;
  SimCommandProcessor processor(std::move(params), clock, options.mTestControl, dataDir);
  SimServer server(processor, clock, options.mQuiet);
  if (server.Listen(options.mBind, options.mPort, list) != 0) return Fail(list.ToText());
  if (options.mScpiPort >= 0 &&
      server.ListenScpi(options.mBind, static_cast<unsigned short>(options.mScpiPort), list) != 0) {
    return Fail(list.ToText());
  }
  if (options.mVxi11Port >= 0 &&
      server.ListenVxi11(options.mBind, static_cast<unsigned short>(options.mVxi11Port), list) != 0) {
    return Fail(list.ToText());
  }
  if (options.mPortMapperPort >= 0 &&
      server.ListenPortMapper(options.mBind, static_cast<unsigned short>(options.mPortMapperPort), list) != 0) {
    return Fail(list.ToText());
  }
  // Without a port mapper of its own, qensim asks the machine's to name the VXI-11 port.
  const bool registering = options.mVxi11Port >= 0 && options.mPortMapperPort < 0;
  Dstring why;
  const bool registered = registering && SimPortMapperClient::Register(true, server.GetVxi11Port(), why);
  if (registering && !registered) {
    std::fprintf(stderr,
                 "qensim: the VXI-11 port %u is not registered with a port mapper on 127.0.0.1:%u (%s); clients must "
                 "be given it, or use --portmap-port\n",
                 server.GetVxi11Port(), SimPortMapperClient::kPort, why.c_str());
  }
  SimServer::InstallSignalHandlers();
  std::printf("qensim listening on %s\n", server.GetEndpoint().c_str());
  if (options.mScpiPort >= 0) std::printf("qensim SCPI on %s\n", server.GetScpiEndpoint().c_str());
  if (options.mVxi11Port >= 0) std::printf("qensim VXI-11 on %s\n", server.GetVxi11Endpoint().c_str());
  if (options.mPortMapperPort >= 0) std::printf("qensim port mapper on %s\n", server.GetPortMapperEndpoint().c_str());
  if (registered) std::printf("qensim VXI-11 registered with the port mapper on 127.0.0.1:%u\n", SimPortMapperClient::kPort);
  std::fflush(stdout);
  const int code = server.Run();
  if (registered && !SimPortMapperClient::Register(false, server.GetVxi11Port(), why)) {
    std::fprintf(stderr, "qensim: the VXI-11 registration could not be taken back (%s)\n", why.c_str());
  }
  return code;
}
