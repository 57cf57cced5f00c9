// The calls against the fake server: each method on the wire, empty results for null, error
// and dead-server replies, the references context, symbols without a URI, and diagnostics
// published and pulled (the slots hosts call them through: connection_slots_test).
#include <gtest/gtest.h>

#include <chrono>
#include <cstdlib>
#include <cstring>
#include <functional>
#include <iterator>
#include <string>
#include <thread>

#include "../protocol/reply_helpers.h"
#include "connection_test_support.h"

namespace {

using namespace connection_test;
using vexil_test::Fields;

constexpr char kName[] = "features";
constexpr char kUri[] = "file:///work/a.cpp";

class ConnectionFeatures : public ::testing::Test {
 protected:
  void SetUp() override { TraceLog::Clear(); }
  void TearDown() override { Dispose(kName); }

  xLanguageServer* Started(std::vector<std::string> directives = {}) { return StartedFake(kName, std::move(directives)); }

  template <typename P>
  static P At(int line, int character) {
    P params;
    params.textDocument.uri = kUri;
    params.position = LSP::Position(line, character);
    return params;
  }
};

// Every request answered with null comes back empty; every call goes out under its own
// method, in the order of the rows, notifications without waiting for a reply (their
// params as written: feature_params_test).
TEST_F(ConnectionFeatures, EveryCallGoesOutUnderItsMethodAndNullRepliesGiveEmptyResults) {
  xLanguageServer* server = nullptr;  // started below, with the rows' methods scripted
  auto position = At<LSP::TextDocumentPositionParams>(3, 4);
  auto completion = At<LSP::CompletionParams>(3, 4);
  auto rename = At<LSP::RenameParams>(3, 4);
  rename.newName = "Limit";
  LSP::DocumentSymbolParams symbols;
  LSP::WorkspaceSymbolParams query;
  LSP::DocumentFormattingParams formatting;
  LSP::DocumentRangeFormattingParams rangeFormatting;
  LSP::CodeActionParams actions;
  LSP::ExecuteCommandParams command;
  command.command = "fake.run";
  LSP::FoldingRangeParams folding;
  LSP::SelectionRangeParams selection;
  LSP::SemanticTokensParams tokens;
  LSP::InlayHintParams hints;
  LSP::CompletionItem item;
  LSP::CallHierarchyItem function;
  auto open = Opened(kUri, "int x;\n");
  auto change = Changed(kUri, "int y;\n");
  LSP::DidSaveTextDocumentParams save;
  LSP::DidCloseTextDocumentParams close;
  LSP::DidChangeConfigurationParams settings;
  LSP::DidChangeWorkspaceFoldersParams folders;
  LSP::WillSaveTextDocumentParams willSave;
  const std::pair<const char*, std::function<bool()>> rows[] = {
      {"textDocument/completion", [&] { return server->TextDocument_Completion(&completion).items.empty(); }},
      {"textDocument/declaration", [&] { return server->TextDocument_Declaration(&position).empty(); }},
      {"textDocument/definition", [&] { return server->TextDocument_Definition(&position).empty(); }},
      {"textDocument/typeDefinition", [&] { return server->TextDocument_TypeDefinition(&position).empty(); }},
      {"textDocument/implementation", [&] { return server->TextDocument_Implementation(&position).empty(); }},
      {"textDocument/references", [&] { return server->TextDocument_References(&position).empty(); }},
      {"textDocument/documentSymbol", [&] { return server->TextDocument_DocumentSymbol(&symbols).empty(); }},
      {"workspace/symbol", [&] { return server->TextDocument_WorkspaceSymbol(&query).empty(); }},
      {"textDocument/hover", [&] { return server->TextDocument_Hover(&position).contents.value.empty(); }},
      {"textDocument/signatureHelp", [&] { return server->TextDocument_Signature(&position).signatures.empty(); }},
      {"textDocument/formatting", [&] { return server->TextDocument_Formatting(&formatting).empty(); }},
      {"textDocument/rangeFormatting", [&] { return server->TextDocument_RangeFormatting(&rangeFormatting).empty(); }},
      {"textDocument/rename", [&] { return server->TextDocument_Rename(&rename).documentChanges.empty(); }},
      {"textDocument/codeAction", [&] { return server->TextDocument_CodeAction(&actions).empty(); }},
      {"workspace/executeCommand", [&] { return server->Workspace_ExecuteCommand(&command) == "null"; }},
      {"textDocument/documentHighlight", [&] { return server->TextDocument_DocumentHighlight(&position).empty(); }},
      {"textDocument/foldingRange", [&] { return server->TextDocument_FoldingRange(&folding).empty(); }},
      {"textDocument/selectionRange", [&] { return server->TextDocument_SelectionRange(&selection).empty(); }},
      {"textDocument/semanticTokens/full",
       [&] { return server->TextDocument_SemanticTokensFull(&tokens).data.empty(); }},
      {"textDocument/inlayHint", [&] { return server->TextDocument_InlayHint(&hints).empty(); }},
      {"completionItem/resolve", [&] { return server->CompletionItem_Resolve(&item).label == ""; }},
      {"textDocument/prepareRename", [&] { return !server->TextDocument_PrepareRename(&position).CanRename(); }},
      {"textDocument/prepareCallHierarchy",
       [&] { return server->TextDocument_PrepareCallHierarchy(&position).empty(); }},
      {"callHierarchy/incomingCalls", [&] { return server->CallHierarchy_IncomingCalls(&function).empty(); }},
      {"callHierarchy/outgoingCalls", [&] { return server->CallHierarchy_OutgoingCalls(&function).empty(); }},
      {"textDocument/didOpen", [&] { return server->TextDocument_DidOpen(&open), true; }},
      {"textDocument/didChange", [&] { return server->TextDocument_DidChange(&change), true; }},
      {"textDocument/didSave", [&] { return server->TextDocument_DidSave(&save), true; }},
      {"textDocument/didClose", [&] { return server->TextDocument_DidClose(&close), true; }},
      {"workspace/didChangeConfiguration", [&] { return server->Workspace_DidChangeConfiguration(&settings), true; }},
      {"workspace/didChangeWorkspaceFolders",
       [&] { return server->Workspace_DidChangeWorkspaceFolders(&folders), true; }},
      {"textDocument/willSave", [&] { return server->TextDocument_WillSave(&willSave), true; }},
  };
  std::string nulls;
  for (const auto& row : rows) nulls += std::string("result=") + row.first + ":null;";
  server = Started({nulls});
  for (const auto& row : rows) EXPECT_TRUE(row.second()) << row.first << " gave a result";
  EXPECT_FALSE(server->HaveErrors());

  std::vector<std::string> sent;
  for (const std::string& body : SentBodies()) {
    std::size_t start = body.find("\"method\":\"") + 10;
    sent.push_back(body.substr(start, body.find('"', start) - start));
  }
  ASSERT_EQ(sent.size(), std::size(rows));
  for (std::size_t at = 0; at < sent.size(); ++at) EXPECT_EQ(sent[at], rows[at].first);
  EXPECT_FALSE(TraceLog::Contains("Timed out"));
  EXPECT_TRUE(TraceLog::Texts("Error").empty());

  // Plain references include the declaration; reference params go as given.
  const std::string params = R"("params":{"textDocument":{"uri":"file:///work/a.cpp"},"position":{"line":3,"character":4},)";
  EXPECT_NE(SentBody("textDocument/references").find(params + R"("context":{"includeDeclaration":true}}})"),
            std::string::npos);
  auto explicitContext = At<LSP::ReferenceParams>(3, 4);
  explicitContext.context.includeDeclaration = false;
  TraceLog::Clear();
  server->TextDocument_References(&explicitContext);
  EXPECT_NE(SentBody("textDocument/references").find(params + R"("context":{"includeDeclaration":false}}})"),
            std::string::npos);
}

// Servers match quick fixes to the diagnostics they published, and resolve completion items
// by their "data": both go back as the server sent them. A pull asks only a server that
// provides diagnostics, whose "unchanged" gives the published list, as does one that does
// not; a publication without errors empties the list.
TEST_F(ConnectionFeatures, DiagnosticsAndItemsGoBackAsTheServerSentThem) {
  for (bool provides : {true, false}) {
    SCOPED_TRACE(provides ? "diagnostic and resolve providers" : "neither provider");
    const std::string capabilities = std::string(provides ? R"({"diagnosticProvider":{},)" : "{") +
                                     R"("completionProvider":{"resolveProvider":)" + (provides ? "true" : "false") +
                                     "}}";
    xLanguageServer* server = Started(
        {"diagnose", "result=initialize:{\"capabilities\": " + capabilities + "}",
         R"(result=textDocument/diagnostic:{"kind": "unchanged","resultId":"r1"})",
         R"(result=textDocument/completion:[{"label": "clamp","data":{"id":7}}])",
         R"x(result=completionItem/resolve:{"label": "clamp","detail":"int clamp(int)"})x",
         R"(result=textDocument/codeAction:[{"title": "Fix it","command":"fake.fix","arguments":[1,{"a":2}]}])"});
    auto open = Opened(kUri, "ok\nerror here\nok\nerror again\n");
    server->TextDocument_DidOpen(&open);
    ASSERT_TRUE(transport_test::WaitFor([&] { return server->TextDocument_Diagnostics(kUri).size() == 2; }));
    LSP::TextDocumentIdentifier document(kUri);
    EXPECT_EQ(server->TextDocument_PullDiagnostics(&document).size(), 2u);
    EXPECT_EQ(SentBody("textDocument/diagnostic") != "", provides);
    EXPECT_TRUE(server->TextDocument_Diagnostics(nullptr).empty());
    EXPECT_TRUE(server->TextDocument_PullDiagnostics(nullptr).empty());

    LSP::CodeActionParams actions;
    actions.textDocument.uri = kUri;
    actions.range = LSP::Range(LSP::Position(1, 2), LSP::Position(1, 2));
    std::vector<LSP::CodeAction> offered = server->TextDocument_CodeAction(&actions);
    EXPECT_TRUE(actions.context.diagnostics.empty()) << "the host's params stay as they are";
    EXPECT_NE(SentBody("textDocument/codeAction").find(
                  R"("context":{"diagnostics":[{"range":{"start":{"line":1,"character":0},"end":{"line":1,"character":5}},)"
                  R"("severity":1,"code":"fake-error","source":"fake","message":"found error"}]}}})"),
              std::string::npos)
        << SentBody("textDocument/codeAction");
    ASSERT_EQ(offered.size(), 1u);
    LSP::ExecuteCommandParams command(offered[0].command);
    EXPECT_NE(server->Workspace_ExecuteCommand(&command).find("workspace/executeCommand"), std::string::npos);
    EXPECT_NE(SentBody("workspace/executeCommand").find(R"("params":{"command":"fake.fix","arguments":[1,{"a":2}]}})"),
              std::string::npos);

    auto completion = At<LSP::CompletionParams>(0, 0);
    std::vector<LSP::CompletionItem> items = server->TextDocument_Completion(&completion).items;
    ASSERT_EQ(items.size(), 1u);
    EXPECT_EQ(server->CompletionItem_Resolve(&items[0]).detail, "int clamp(int)");
    EXPECT_NE(SentBody("completionItem/resolve")
                  .find(provides ? R"("params":{"label":"clamp","data":{"id":7}}})" : R"("params":{"label":"clamp"}})"),
              std::string::npos);
    auto fixed = Changed(kUri, "ok\n");
    server->TextDocument_DidChange(&fixed);
    EXPECT_TRUE(transport_test::WaitFor([&] { return server->TextDocument_Diagnostics(kUri).empty(); }));
    Dispose(kName);
  }
  // Host-given JSON text that is not JSON is refused before anything is sent.
  xLanguageServer* server = Started();
  LSP::ExecuteCommandParams command;
  command.arguments = "[1,";
  LSP::DidChangeConfigurationParams settings;
  settings.settings = "{";
  EXPECT_EQ(server->Workspace_ExecuteCommand(&command), "");
  EXPECT_STREQ(server->ErrorMessage(), "Invalid JSON for arguments: Invalid value.");
  server->Workspace_DidChangeConfiguration(&settings);
  EXPECT_STREQ(server->ErrorMessage(), "Invalid JSON for settings: Missing a name for object member.");
  EXPECT_TRUE(SentBodies().empty());
  EXPECT_EQ(TraceLog::Texts("Error").size(), 2u);
}

TEST_F(ConnectionFeatures, HierarchicalSymbolsBelongToTheRequestedDocument) {
  // The blank after the first colon makes Windows launches quote the argument whole
  // instead of taking its quotation marks as the caller's own quoting.
  xLanguageServer* server = Started({R"(result=textDocument/documentSymbol:[{"name": "Clamp","kind":12,)"
                                     R"("range":{"start":{"line":16,"character":0},"end":{"line":20,"character":1}},)"
                                     R"("selectionRange":{"start":{"line":16,"character":4},"end":{"line":16,"character":9}}}])"});
  LSP::DocumentSymbolParams params;
  params.textDocument.uri = kUri;
  std::vector<LSP::SymbolInformation> symbols = server->TextDocument_DocumentSymbol(&params);
  ASSERT_EQ(symbols.size(), 1u);
  EXPECT_EQ(Fields(symbols[0].name, symbols[0].location.uri, symbols[0].location.range),
            "Clamp|file:///work/a.cpp|16:0-20:1");
}

// A full report pulled is stored, and its id goes back with the next pull.
TEST_F(ConnectionFeatures, PullingStoresAFullReportAndSendsItsIdBack) {
  xLanguageServer* server = Started(
      {R"(result=initialize:{"capabilities": {"diagnosticProvider":{"interFileDependencies":false,"workspaceDiagnostics":false}}})",
       R"(result=textDocument/diagnostic:{"kind": "full","resultId":"r7","items":[{"range":{"start":{"line":4,"character":1},"end":{"line":4,"character":3}},"severity":2,"code":12,"source":"json","message":"Trailing comma"}]})"});
  LSP::TextDocumentIdentifier document(kUri);
  int before = server->DiagnosticsVersion();

  auto pulled = server->TextDocument_PullDiagnostics(&document);
  ASSERT_EQ(pulled.size(), 1u);
  EXPECT_EQ(Fields(pulled[0].message, pulled[0].range, pulled[0].severity, pulled[0].code, pulled[0].codeText),
            "Trailing comma|4:1-4:3|2|12|12");
  EXPECT_NE(SentBody("textDocument/diagnostic")
                .find(R"("method":"textDocument/diagnostic","params":{"textDocument":{"uri":"file:///work/a.cpp"}}})"),
            std::string::npos);
  EXPECT_NE(server->DiagnosticsVersion(), before);
  EXPECT_EQ(server->TextDocument_Diagnostics(kUri).size(), 1u);

  TraceLog::Clear();
  server->TextDocument_PullDiagnostics(&document);
  EXPECT_NE(SentBody("textDocument/diagnostic").find(R"("previousResultId":"r7")"), std::string::npos);
}

// Requests and notifications of any method, with params as JSON text, and every way one
// fails; typed requests after them, refused and to a dead server.
TEST_F(ConnectionFeatures, AnyMethodWithJsonParamsAndEveryFailureThenTypedFailures) {
  struct Row {
    const char* method;
    const char* params;
    const char* returned;  // Request's result; Notify's is whether it was sent
    const char* sent;      // the params as sent; null when nothing is sent
    const char* error;     // ErrorMessage() afterwards
    bool notify = false;
  };
  const Row rows[] = {
      {"fake/echo", R"( {"a": [1, "x"], "b":{}} )",
       R"({"method":"fake/echo","answers":[],"received":["{\"jsonrpc\":\"2.0\",\"method\":\"initialized\",\"params\":{}}"]})",
       R"(,"params":{"a":[1,"x"],"b":{}}})", ""},
      {"fake/null", nullptr, "null", "}", ""},
      {"fake/null", "null", "null", "}", ""},
      {"fake/refused", "", "", "}", "refused fake/refused"},
      {"fake/echo", "{oops", "", nullptr, "Invalid JSON for fake/echo: Missing a name for object member."},
      {"fake/echo", "[1]", "", nullptr, "Invalid JSON for fake/echo: not an object"},
      {"fake/note", R"({"c":true})", "true", R"(,"params":{"c":true}})", "", true},
      {"fake/note", "", "true", "}", "", true},
      {"fake/note", "{", "", nullptr, "Invalid JSON for fake/note: Missing a name for object member.", true},
      {"fake/silent", "{}", "", R"(,"params":{}})", ""},
  };
  xLanguageServer* server = Started({"result=fake/null:null;error=fake/refused;error=textDocument/hover"});
  for (const Row& row : rows) {
    SCOPED_TRACE(row.method + std::string(" ") + (row.params ? row.params : "(null)"));
    TraceLog::Clear();
    std::string returned = row.notify ? (server->Notify(row.method, row.params) ? "true" : "")
                                      : server->Request(row.method, row.params);
    EXPECT_EQ(returned, row.returned);
    EXPECT_STREQ(server->ErrorMessage(), row.error);
    EXPECT_EQ(server->HaveErrors(), *row.error != '\0');
    std::string sent = SentBody(row.method);
    EXPECT_EQ(sent.empty() ? "(none)" : sent.substr(sent.find(row.method) + strlen(row.method) + 1),
              row.sent ? row.sent : "(none)");
    if (!row.sent) {
      EXPECT_EQ(TraceLog::Texts("Error"), std::vector<std::string>{std::string(row.error) + "\n"});
    }
  }
  EXPECT_EQ(TraceLog::Count("Reply: Timed out waiting for reply......\n"), 1);
  EXPECT_NE(SentBody("$/cancelRequest"), "");
  auto position = At<LSP::TextDocumentPositionParams>(0, 0);
  EXPECT_TRUE(server->TextDocument_Hover(&position).contents.value.empty());
  EXPECT_STREQ(server->ErrorMessage(), "refused textDocument/hover");
  server->TextDocument_Definition(&position);
  EXPECT_FALSE(server->HaveErrors()) << "every request starts with a clean error state";

  vexil_test::KillProcess(server->Id());
  ASSERT_TRUE(transport_test::WaitFor([&] { return !server->IsRunning(); }));
  TraceLog::Clear();
  LSP::DidCloseTextDocumentParams close;
  server->TextDocument_DidClose(&close);
  EXPECT_TRUE(TraceLog::Lines().empty()) << "nothing is written to a dead server";
  EXPECT_TRUE(server->TextDocument_Definition(&position).empty());
  EXPECT_STREQ(server->ErrorMessage(), "A server read was requested but the server is not running.");
  EXPECT_EQ(server->Request("fake/echo", "{}"), "");
  EXPECT_STREQ(server->ErrorMessage(), "A server read was requested but the server is not running.");
  EXPECT_FALSE(server->Notify("fake/note", "{}"));
}

// A host that runs calls on a worker thread cancels a stale one from its UI thread.
TEST_F(ConnectionFeatures, CancelEndsAWaitingCallAndNothingElse) {
  xLanguageServer* server = Started();
  server->Cancel();  // nothing waits: the next call is not affected
  EXPECT_NE(server->Request("fake/echo", "{}"), "");

  std::thread canceller([&] {
    transport_test::WaitFor([] { return SentBody("fake/silent") != ""; });
    server->Cancel();
  });
  auto asked = std::chrono::steady_clock::now();
  std::string returned = server->Request("fake/silent", R"({"delay":100000})");
  canceller.join();
  EXPECT_LT(std::chrono::steady_clock::now() - asked, std::chrono::seconds(1));
  EXPECT_EQ(returned, "");
  EXPECT_FALSE(server->HaveErrors());
  int id = std::stoi(SentBody("fake/silent").substr(std::strlen(R"({"jsonrpc":"2.0","id":)")));
  EXPECT_EQ(TraceLog::Texts("Error"), std::vector<std::string>{});
  EXPECT_EQ(TraceLog::Count("Request Cancelled: " + std::to_string(id) + "\n"), 1);
  EXPECT_EQ(SentBody("$/cancelRequest"),
            R"({"jsonrpc":"2.0","method":"$/cancelRequest","params":{"id":)" + std::to_string(id) + "}}");
}

// The server runs in the host's environment plus what the host set, minus what it removed.
TEST_F(ConnectionFeatures, ServersGetTheEnvironmentTheHostSet) {
  xLanguageServer* server = Fake(kName);
  const char* removed = std::getenv("HOME") ? "HOME" : "TEMP";
  EXPECT_TRUE(server->SetEnvironment("VEXIL_FIRST", "one"));
  EXPECT_TRUE(server->SetEnvironment("VEXIL_SECOND", "two words=2"));
  EXPECT_TRUE(server->SetEnvironment("VEXIL_FIRST", "1"));
  EXPECT_TRUE(server->SetEnvironment(removed, nullptr));
  for (const char* invalid : {"", "A=B"}) EXPECT_FALSE(server->SetEnvironment(invalid, "x"));
  EXPECT_FALSE(server->SetEnvironment(nullptr, "x"));
  ASSERT_TRUE(server->Start(xServerInitialise()));
  EXPECT_FALSE(server->SetEnvironment("VEXIL_LATE", "x")) << "the server runs already";
  std::string names = std::string(R"({"names":["VEXIL_FIRST","VEXIL_SECOND",")") + removed + R"("]})";
  EXPECT_NE(server->Request("fake/env", names.c_str())
                .find(std::string(R"("env":{"VEXIL_FIRST":"1","VEXIL_SECOND":"two words=2",")") + removed + R"(":null})"),
            std::string::npos);
}

}  // namespace
