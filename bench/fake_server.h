// The scripted fake server seen through xServer, as the transport and memory benchmarks
// start and end it.
#pragma once

#include <memory>
#include <string>

#include "transport/server.h"

namespace bench {

// Started with the start-up `directives`; null when it did not start.
inline std::unique_ptr<vexil::xServer> StartFakeServer(const std::string& directives, int timeoutMs) {
  xServerStart start;
  start.executable = VEXIL_FAKE_SERVER;
  start.argument1 = directives;
  start.timeout = timeoutMs;
  auto server = std::make_unique<vexil::xServer>(start);
  if (!server->Start()) server.reset();
  return server;
}

inline void EndFakeServer(vexil::xServer& server) {
  LSP::NotificationMessage exit("exit", nullptr);
  server.Write(exit);
}

}  // namespace bench
