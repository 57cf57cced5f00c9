// The host's view of one language-server connection, and the two exports that find or
// create connections by server name.
#pragma once

#include <string>
#include <vector>

#include "vexil/export.h"
#include "vexil/host/records.h"
#include "vexil/host/server_messages.h"
#include "vexil/protocol/call_hierarchy.h"
#include "vexil/protocol/code_actions.h"
#include "vexil/protocol/diagnostics.h"
#include "vexil/protocol/document_features.h"
#include "vexil/protocol/feature_params.h"
#include "vexil/protocol/feature_results.h"
#include "vexil/protocol/semantic_tokens.h"
#include "vexil/protocol/server_capabilities.h"
#include "vexil/protocol/workspace_notifications.h"

// One connection. Hosts call through the virtual slots, so the declaration order below is
// part of the calling contract and must never change (Exit first, RangeFormatting after
// Formatting). Connections destroy themselves in a successful Exit; hosts never delete them.
// Every call runs on the host's thread (Cancel, Reply and ReplyError on any thread) and never
// throws for protocol or I/O failures: failures give empty results or false, and
// HaveErrors()/ErrorMessage() tell what went wrong.
class VEXIL_API xLanguageServer {
 public:
  // Sends "exit" and waits about a second for the server to end; true when it did, and
  // then the connection is gone.
  virtual bool Exit() = 0;
  virtual const char* ErrorMessage() = 0;
  virtual bool HaveErrors() = 0;
  // The server's process id, -1 when none runs.
  virtual int Id() = 0;
  virtual bool Initialize(const xServerInitialise& init) = 0;
  virtual bool IsRunning() = 0;
  // Launches the server unless it runs, then initializes it.
  virtual bool Start(const xServerInitialise& init) = 0;
  virtual bool Shutdown() = 0;
  virtual LSP::CompletionList TextDocument_Completion(LSP::CompletionParams* params) = 0;
  virtual std::vector<LSP::Location> TextDocument_Declaration(LSP::TextDocumentPositionParams* params) = 0;
  virtual std::vector<LSP::Location> TextDocument_Definition(LSP::TextDocumentPositionParams* params) = 0;
  virtual std::vector<LSP::Location> TextDocument_TypeDefinition(LSP::TextDocumentPositionParams* params) = 0;
  virtual std::vector<LSP::Location> TextDocument_Implementation(LSP::TextDocumentPositionParams* params) = 0;
  // A plain TextDocumentPositionParams is sent with "includeDeclaration": true; a
  // ReferenceParams is sent as it is.
  virtual std::vector<LSP::Location> TextDocument_References(LSP::TextDocumentPositionParams* params) = 0;
  virtual std::vector<LSP::SymbolInformation> TextDocument_DocumentSymbol(LSP::DocumentSymbolParams* params) = 0;
  virtual std::vector<LSP::SymbolInformation> TextDocument_WorkspaceSymbol(LSP::WorkspaceSymbolParams* params) = 0;
  virtual LSP::Hover TextDocument_Hover(LSP::TextDocumentPositionParams* params) = 0;
  virtual LSP::SignatureHelp TextDocument_Signature(LSP::TextDocumentPositionParams* params) = 0;
  virtual std::vector<LSP::TextEdit> TextDocument_Formatting(LSP::DocumentFormattingParams* params) = 0;
  virtual std::vector<LSP::TextEdit> TextDocument_RangeFormatting(LSP::DocumentRangeFormattingParams* params) = 0;
  virtual LSP::WorkspaceEdit TextDocument_Rename(LSP::RenameParams* params) = 0;
  virtual void TextDocument_DidChange(LSP::DidChangeTextDocumentParams* params) = 0;
  virtual void TextDocument_DidClose(LSP::DidCloseTextDocumentParams* params) = 0;
  virtual void TextDocument_DidOpen(LSP::DidOpenTextDocumentParams* params) = 0;
  virtual void TextDocument_DidSave(LSP::DidSaveTextDocumentParams* params) = 0;
  // Later additions: hosts built before them still find every slot above in its place.
  // The newest diagnostics the server published or reported for the document `uri`;
  // empty when there are none. Answered from the connection's store, without a message.
  virtual std::vector<LSP::Diagnostic> TextDocument_Diagnostics(const char* uri) = 0;
  // Moves on whenever a document's diagnostics change; poll it and fetch on a change.
  virtual int DiagnosticsVersion() = 0;
  // Asks a server that announced a diagnostic provider ("textDocument/diagnostic") and
  // stores the answer; to any other server nothing is sent and the stored ones return.
  virtual std::vector<LSP::Diagnostic> TextDocument_PullDiagnostics(LSP::TextDocumentIdentifier* document) = 0;
  // Opts in to `feature`, before Initialize; false for a name the library does not know.
  // "progress" announces work-done progress (window.workDoneProgress) and hands the
  // server's "window/workDoneProgress/create" to the message handler; "configuration"
  // announces workspace.configuration and hands "workspace/configuration" to the handler;
  // "messages" hands the handler both of those and every server request the library
  // cannot answer itself; "features" announces what the calls after SetEnvironment need and
  // hands the handler "workspace/applyEdit"; "watchedFiles" tells the server about files
  // changed in the workspace folders as it registers for them; "positionEncoding" offers
  // UTF-8 columns (ServerCapabilities().positionEncoding says what the server chose). With
  // nothing enabled the initialize request is what it always was.
  virtual bool Enable(const char* feature) = 0;
  // What the server announced in its reply to initialize.
  virtual LSP::ServerCapabilities ServerCapabilities() = 0;
  // The reply's "capabilities" object as JSON text; empty before Initialize.
  virtual const char* ServerCapabilitiesJson() = 0;
  // Sends the request `method` with `paramsJson` (a JSON object; null or "" sends no
  // params) and returns the reply's "result" as JSON text, "null" for a null result. On
  // any failure it returns "" and the error state and trace lines are those of the typed
  // calls; params that are not a JSON object are refused before anything is sent, with
  // the "Error" line "Invalid JSON for <method>: <reason>".
  virtual std::string Request(const char* method, const char* paramsJson) = 0;
  // Sends the notification `method`, under the same rules; true once it was written.
  virtual bool Notify(const char* method, const char* paramsJson) = 0;
  // The server's own messages and its exit go to `handler` (see xMessageHandler); null
  // stops handing them over. Without a handler everything stays as before.
  virtual void SetMessageHandler(xMessageHandler handler, void* userData) = 0;
  // Answer a server request handed to the handler, from any thread: with a result as JSON
  // text (null or "" for null), or with an error. False for an id that does not wait for
  // an answer (unknown, or answered already) and for a result that is not JSON. A request
  // left unanswered for 30 s, or still waiting at Exit, gets error -32803 "Request not answered".
  virtual bool Reply(const char* idJson, const char* resultJson) = 0;
  virtual bool ReplyError(const char* idJson, int code, const char* message) = 0;
  // From any other thread: ends the request in progress (being written, or waiting for
  // its reply) within 100 ms, as a time-out would (empty result, error state untouched, "$/cancelRequest" sent) but tracing only
  // "Request Cancelled: <id>" under "Message". Does nothing when no call waits.
  virtual void Cancel() = 0;
  // Sets (a null value: removes) a variable of the server's environment, which is the
  // host's own plus these; before Start. False for a name that cannot be a variable's and
  // while the server runs.
  virtual bool SetEnvironment(const char* name, const char* value) = 0;
  // The requests IDEs use beyond the classic ones, under the same rules: empty results on
  // any failure, the error state and trace lines as for the other calls. Enable("features")
  // announces the client capabilities that servers look for before they answer them.
  // Quick fixes and refactorings for a range. A context without diagnostics is sent with
  // the diagnostics the server published for the document that touch the range, as the
  // server sent them (servers match fixes to their own diagnostics).
  virtual std::vector<LSP::CodeAction> TextDocument_CodeAction(LSP::CodeActionParams* params) = 0;
  // Runs a command of a code action or a code lens; its result as JSON text, "null" for
  // a null result, "" on failure. Arguments that are not a JSON array are refused.
  virtual std::string Workspace_ExecuteCommand(LSP::ExecuteCommandParams* params) = 0;
  virtual std::vector<LSP::DocumentHighlight> TextDocument_DocumentHighlight(LSP::TextDocumentPositionParams* params) = 0;
  virtual std::vector<LSP::FoldingRange> TextDocument_FoldingRange(LSP::FoldingRangeParams* params) = 0;
  virtual std::vector<LSP::SelectionRange> TextDocument_SelectionRange(LSP::SelectionRangeParams* params) = 0;
  // Decode the tokens with ServerCapabilities().semanticTokensProvider.legend.
  virtual LSP::SemanticTokens TextDocument_SemanticTokensFull(LSP::SemanticTokensParams* params) = 0;
  virtual std::vector<LSP::InlayHint> TextDocument_InlayHint(LSP::InlayHintParams* params) = 0;
  // Sends an item of a completion list back as the server sent it, "data" included, and
  // returns it with the details the server adds. Items keep what the server sent only when
  // it announced completionProvider.resolveProvider; others go back as their label.
  virtual LSP::CompletionItem CompletionItem_Resolve(LSP::CompletionItem* item) = 0;
  virtual LSP::PrepareRenameResult TextDocument_PrepareRename(LSP::TextDocumentPositionParams* params) = 0;
  virtual std::vector<LSP::CallHierarchyItem> TextDocument_PrepareCallHierarchy(LSP::TextDocumentPositionParams* params) = 0;
  // `item` is one that TextDocument_PrepareCallHierarchy (or a call) returned.
  virtual std::vector<LSP::CallHierarchyIncomingCall> CallHierarchy_IncomingCalls(LSP::CallHierarchyItem* item) = 0;
  virtual std::vector<LSP::CallHierarchyOutgoingCall> CallHierarchy_OutgoingCalls(LSP::CallHierarchyItem* item) = 0;
  // Settings that are not JSON are refused with the "Error" line "Invalid JSON for settings: <reason>".
  virtual void Workspace_DidChangeConfiguration(LSP::DidChangeConfigurationParams* params) = 0;
  virtual void Workspace_DidChangeWorkspaceFolders(LSP::DidChangeWorkspaceFoldersParams* params) = 0;
  virtual void TextDocument_WillSave(LSP::WillSaveTextDocumentParams* params) = 0;

 protected:
  // Not virtual, so no slot precedes Exit; protected, so hosts end connections with Exit.
  ~xLanguageServer() = default;
};

// The connection registered under `name` (exact, case-sensitive), or null. Creates nothing.
VEXIL_EXTERN_C VEXIL_API xLanguageServer* Vexil_Have(const char* name);
// The connection registered under `start.name`, or else a new one registered under it.
// Nothing is launched until Start.
VEXIL_EXTERN_C VEXIL_API xLanguageServer* Vexil_Start(const xServerStart& start);
