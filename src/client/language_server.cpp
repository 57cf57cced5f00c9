// The connection's life: the initialize handshake, shutdown, and exit, after which the
// connection leaves the registry and destroys itself.
#include "client/language_server.h"

#include <algorithm>

#include <Poco/Thread.h>

#include "host/server_registry.h"
#include "vexil/client/uri.h"

namespace LSP {
namespace {

// Servers take up to 0.7 s to answer initialize; requests sent before that answer are
// refused, so the handshake gets at least this long whatever the host's time-out.
constexpr int kInitializeTimeoutMs = 10000;
constexpr long kExitPollMs = 100;
constexpr int kExitPolls = 10;

// Lends the transport a longer reply wait for one exchange.
class LongerWait {
 public:
  LongerWait(vexil::xServer& server, int milliseconds) : server_(server), saved_(server.Timeout()) {
    server_.Timeout(std::max(milliseconds, saved_));
  }
  LongerWait(const LongerWait&) = delete;
  LongerWait& operator=(const LongerWait&) = delete;
  ~LongerWait() { server_.Timeout(saved_); }

 private:
  vexil::xServer& server_;
  int saved_;
};

// "initialized" carries an empty object, written as "params":{}.
class InitializedParams : public Params {
 public:
  void Write(xWriter& writer) override {}
};

}  // namespace

LanguageServer::LanguageServer(const xServerStart& start) : server(start) {}

bool LanguageServer::Start(const xServerInitialise& init) {
  if (!IsRunning()) {
    StopWatchingFiles();
    initialized = false;
    server.Start();  // a failed launch shows in Initialize, which then finds nothing running
  }
  return Initialize(init);
}

bool LanguageServer::Initialize(const xServerInitialise& init) {
  if (initialized) return true;
  if (!IsRunning()) return false;
  TraceInitialise(init);
  InitializeParams params(init.processId, FileToUri(init.rootPath.c_str()), server.Level(),
                          InitializationOptions(init.options));
  params.workspaceFolders = init.workspaceFolders;
  params.capabilities.additions = features.capabilities;
  server.WorkspaceFolders(params.workspaceFolders);
  {
    LongerWait wait(server, kInitializeTimeoutMs);
    Request("initialize", &params, result);
  }
  // A reply that never came still counts: only an error reply or a dead server fails.
  initialized = !server.HaveErrors();
  if (initialized) WatchFiles(init);
  if (Initialized()) FilesInitialized();
  return initialized;
}

bool LanguageServer::Initialized() {
  if (!initialized || !IsRunning()) return false;
  InitializedParams params;
  Send("initialized", &params);
  return true;
}

bool LanguageServer::Shutdown() {
  StopWatchingFiles();
  if (IsRunning()) {
    // Waiting for the reply's own id: nothing follows a shutdown reply, so waiting for
    // anything else would always run the whole time-out.
    RequestMessage request("shutdown", nullptr);
    ResponseMessage response(nullptr);
    server.Write(request);
    server.Read(request.id, response);
    if (response.HaveError()) return false;
  }
  initialized = false;
  return true;
}

bool LanguageServer::Exit() {
  StopWatchingFiles();
  if (IsRunning()) {
    // Answered before "exit": a server must never wait on a host that is going away.
    server.DeclineHostRequests();
    Send("exit", nullptr);
    if (!AwaitEnd()) return false;
  }
  // While the object is whole: the handler may still call Reply.
  server.FinishMessages();
  Erase(this);
  delete this;
  return true;
}

bool LanguageServer::AwaitEnd() {
  Poco::Thread::sleep(kExitPollMs);
  for (int poll = 0; poll < kExitPolls && IsRunning(); ++poll) Poco::Thread::sleep(kExitPollMs);
  return !IsRunning();
}

void LanguageServer::Erase(xLanguageServer* server) { vexil::UnregisterServer(server); }

void LanguageServer::TraceInitialise(const xServerInitialise& init) const {
  vexil::Tracer tracer(server.Trace(), server.Level());
  tracer.Verbose("Process Id: %d\n", init.processId);
  tracer.Verbose(" Root Path: %s\n", init.rootPath.c_str());
  tracer.Verbose("   Options: %s\n", init.options.c_str());
}

}  // namespace LSP
