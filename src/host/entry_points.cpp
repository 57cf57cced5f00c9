// The two plain exports for language servers: find a connection by name, or create and
// register one. Neither launches anything.
#include <memory>

#include "client/language_server.h"
#include "host/server_registry.h"

xLanguageServer* Vexil_Have(const char* name) { return vexil::FindServer(name ? name : ""); }

xLanguageServer* Vexil_Start(const xServerStart& start) {
  if (xLanguageServer* existing = Vexil_Have(start.name.c_str())) return existing;
  // Owned here until registered, so a failed insert leaves neither entry nor connection.
  auto server = std::make_unique<LSP::LanguageServer>(start);
  vexil::RegisterServer(start.name, server.get());
  return server.release();
}
