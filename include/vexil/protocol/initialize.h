// The "initialize" exchange: the params the client sends (process, root, host options,
// capabilities, trace, folders) and the result it keeps (the server's capabilities).
#pragma once

#include <string>
#include <vector>

#include "vexil/host/trace.h"
#include "vexil/protocol/capabilities.h"
#include "vexil/protocol/server_capabilities.h"
#include "vexil/protocol/structures.h"

namespace LSP {

// The host's configuration text for a server: a JSON object whose member
// "initializationOptions" is passed on verbatim, as JSON. Text that is empty, not JSON
// or without that member adds nothing to the request.
class VEXIL_API InitializationOptions : public JsonObject {
 public:
  explicit InitializationOptions(const std::string& text) : text(text) {}
  const char* Name() const override { return "initializationOptions"; }
  void Read(const xObject& value) override {}
  using JsonObject::Read;
  // Writes the member with its key, or nothing at all.
  void Write(xWriter& writer) override;

  std::string text;
};

class VEXIL_API ClientInfo : public Params {
 public:
  ClientInfo() { Params::name = "clientInfo"; }
  void Write(xWriter& writer) override;

  // Hides Params::name, which keeps the key "clientInfo" for Name().
  std::string name = "Tavra IDE - LSP Client";
  std::string version = "2.9.1";
};

class VEXIL_API InitializeParams : public Params {
 public:
  InitializeParams(int processId, const std::string& rootUri, TraceLevel trace,
                   const InitializationOptions& options);
  void Write(xWriter& writer) override;

  int processId;
  std::string rootUri;
  InitializationOptions initializationOptions;
  ClientCapabilities capabilities;
  std::string trace;
  std::vector<WorkspaceFolder> workspaceFolders;
};

class VEXIL_API InitializeResult : public Result {
 public:
  void Read(const xObject& value) override;
  using JsonObject::Read;
  void Write(xWriter& writer) override {}

  ServerCapabilities capabilities;
  // The reply's "capabilities" object as compact JSON text, for what the model does not
  // read; empty when there was none (or it nests deeper than the library walks).
  std::string capabilitiesJson;
};

}  // namespace LSP
