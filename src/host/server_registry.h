// The process-wide map from a server's name to its connection. It has no lock: the host
// starts, finds and ends connections from one thread.
#pragma once

#include <cstddef>
#include <string>

#include "vexil/host/language_server.h"

namespace vexil {

// The connection registered under `name`, or null.
xLanguageServer* FindServer(const std::string& name);
// Registers `server` under `name` unless the name is taken; an entry is never overwritten.
void RegisterServer(const std::string& name, xLanguageServer* server);
// Removes the entry holding `server` (the first in name order). When none holds it, the
// entry with the empty name goes instead, should there be one.
void UnregisterServer(xLanguageServer* server);
std::size_t RegisteredServers();

}  // namespace vexil
