// LSP::LanguageServer: the connection behind xLanguageServer. It owns the server
// transport, runs the initialize/shutdown/exit handshake and turns each host call into
// one protocol message.
#pragma once

#include <memory>
#include <mutex>

#include "client/client_features.h"
#include "client/json_params.h"
#include "client/watched_files.h"
#include "host/trace_line.h"
#include "transport/server.h"
#include "vexil/host/language_server.h"
#include "vexil/protocol/initialize.h"

namespace LSP {

// Final, because Exit deletes the object through its own type and there is no virtual
// destructor (the host's slot table has none).
class LanguageServer final : public xLanguageServer {
 public:
  explicit LanguageServer(const xServerStart& start);
  LanguageServer(const LanguageServer&) = delete;
  LanguageServer& operator=(const LanguageServer&) = delete;
  ~LanguageServer() { StopWatchingFiles(); }

  bool Exit() override;
  const char* ErrorMessage() override { return server.ErrorMessage(); }
  bool HaveErrors() override { return server.HaveErrors(); }
  int Id() override { return server.Id(); }
  bool Initialize(const xServerInitialise& init) override;
  bool IsRunning() override { return server.IsRunning(); }
  bool Start(const xServerInitialise& init) override;
  bool Shutdown() override;

  CompletionList TextDocument_Completion(CompletionParams* params) override;
  std::vector<Location> TextDocument_Declaration(TextDocumentPositionParams* params) override;
  std::vector<Location> TextDocument_Definition(TextDocumentPositionParams* params) override;
  std::vector<Location> TextDocument_TypeDefinition(TextDocumentPositionParams* params) override;
  std::vector<Location> TextDocument_Implementation(TextDocumentPositionParams* params) override;
  std::vector<Location> TextDocument_References(TextDocumentPositionParams* params) override;
  std::vector<SymbolInformation> TextDocument_DocumentSymbol(DocumentSymbolParams* params) override;
  std::vector<SymbolInformation> TextDocument_WorkspaceSymbol(WorkspaceSymbolParams* params) override;
  Hover TextDocument_Hover(TextDocumentPositionParams* params) override;
  SignatureHelp TextDocument_Signature(TextDocumentPositionParams* params) override;
  std::vector<TextEdit> TextDocument_Formatting(DocumentFormattingParams* params) override;
  std::vector<TextEdit> TextDocument_RangeFormatting(DocumentRangeFormattingParams* params) override;
  WorkspaceEdit TextDocument_Rename(RenameParams* params) override;
  void TextDocument_DidChange(DidChangeTextDocumentParams* params) override;
  void TextDocument_DidClose(DidCloseTextDocumentParams* params) override;
  void TextDocument_DidOpen(DidOpenTextDocumentParams* params) override;
  void TextDocument_DidSave(DidSaveTextDocumentParams* params) override;
  std::vector<Diagnostic> TextDocument_Diagnostics(const char* uri) override;
  int DiagnosticsVersion() override { return server.Diagnostics().Version(); }
  std::vector<Diagnostic> TextDocument_PullDiagnostics(TextDocumentIdentifier* document) override;
  bool Enable(const char* feature) override;
  // Qualified: inside the class the bare name is the member function's.
  LSP::ServerCapabilities ServerCapabilities() override { return result.capabilities; }
  const char* ServerCapabilitiesJson() override { return result.capabilitiesJson.c_str(); }
  std::string Request(const char* method, const char* paramsJson) override;
  bool Notify(const char* method, const char* paramsJson) override;
  void SetMessageHandler(xMessageHandler handler, void* userData) override;
  bool Reply(const char* idJson, const char* resultJson) override { return server.Reply(idJson, resultJson); }
  bool ReplyError(const char* idJson, int code, const char* message) override {
    return server.ReplyError(idJson, code, message);
  }
  void Cancel() override { server.CancelWait(); }
  bool SetEnvironment(const char* name, const char* value) override { return server.Environment(name, value); }
  std::vector<CodeAction> TextDocument_CodeAction(CodeActionParams* params) override;
  std::string Workspace_ExecuteCommand(ExecuteCommandParams* params) override;
  std::vector<DocumentHighlight> TextDocument_DocumentHighlight(TextDocumentPositionParams* params) override;
  std::vector<FoldingRange> TextDocument_FoldingRange(FoldingRangeParams* params) override;
  std::vector<SelectionRange> TextDocument_SelectionRange(SelectionRangeParams* params) override;
  SemanticTokens TextDocument_SemanticTokensFull(SemanticTokensParams* params) override;
  std::vector<InlayHint> TextDocument_InlayHint(InlayHintParams* params) override;
  CompletionItem CompletionItem_Resolve(CompletionItem* item) override;
  PrepareRenameResult TextDocument_PrepareRename(TextDocumentPositionParams* params) override;
  std::vector<CallHierarchyItem> TextDocument_PrepareCallHierarchy(TextDocumentPositionParams* params) override;
  std::vector<CallHierarchyIncomingCall> CallHierarchy_IncomingCalls(CallHierarchyItem* item) override;
  std::vector<CallHierarchyOutgoingCall> CallHierarchy_OutgoingCalls(CallHierarchyItem* item) override;
  void Workspace_DidChangeConfiguration(DidChangeConfigurationParams* params) override;
  void Workspace_DidChangeWorkspaceFolders(DidChangeWorkspaceFoldersParams* params) override;
  void TextDocument_WillSave(WillSaveTextDocumentParams* params) override;

 protected:
  // Sends "initialized" once the handshake succeeded and the server still runs.
  bool Initialized();
  // Removes `server` from the registry (see UnregisterServer for the empty-name rule).
  static void Erase(xLanguageServer* server);

 private:
  void TraceInitialise(const xServerInitialise& init) const;
  // The one request pattern: send `method` with `params`, wait for the reply to its id
  // and read the reply's result into `holder`, which stays empty on any failure. True
  // when the reply came and carried no error.
  bool Request(const char* method, Params* params, Result& holder);
  // The request pattern for a holder made here, returned with whatever it was given.
  template <typename Holder>
  Holder Ask(const char* method, Params* params, Holder holder = Holder());
  // The request pattern for a result of any shape: its JSON text, "null" for a null
  // result, "" on any failure.
  std::string RequestJson(const char* method, Params* params);
  bool Send(const char* method, Params* params);
  // Whether `params` can be written; false, with the error state set and traced, when
  // JSON text the host gave in them is not JSON.
  bool Writable(Params& params);
  // Checks a method and its params given as JSON text; false, with the error state set
  // and traced, when they cannot be sent.
  bool Prepared(const char* method, const char* paramsJson, JsonParams& params);
  // Polls until the process has ended or the limit has passed; true when it ended.
  bool AwaitEnd();
  // With "watchedFiles" enabled: watches the workspace folders of `init` and takes the
  // server's registrations, before "initialized" is sent. Nothing is sent before
  // FilesInitialized().
  void WatchFiles(const xServerInitialise& init);
  void FilesInitialized();
  // Ends the watching, before the server is stopped, started again or left.
  void StopWatchingFiles();

  vexil::xServer server;
  bool initialized = false;
  InitializeResult result;
  EnabledFeatures features;
  // Swapped under its lock: the output reader hands it the server's registrations.
  std::mutex filesMutex;
  std::unique_ptr<vexil::WatchedFilesNotifier> files;
};

template <typename Holder>
Holder LanguageServer::Ask(const char* method, Params* params, Holder holder) {
  Request(method, params, holder);
  return holder;
}

}  // namespace LSP
