// Diagnostics through the host's interface: publications after didOpen and didChange, the
// pull request with its result id, and a host built before the diagnostics slots existed.
#include <gtest/gtest.h>

#include <string>

#include "connection_test_support.h"

// The interface as hosts built before the diagnostics slots declare it. Outside the
// anonymous namespace: there the compiler would see that nothing implements it and call
// the pure functions directly.
namespace older_host {

class OlderLanguageServer {
 public:
  virtual bool Exit() = 0;
  virtual const char* ErrorMessage() = 0;
  virtual bool HaveErrors() = 0;
  virtual int Id() = 0;
  virtual bool Initialize(const xServerInitialise& init) = 0;
  virtual bool IsRunning() = 0;
  virtual bool Start(const xServerInitialise& init) = 0;
  virtual bool Shutdown() = 0;
  virtual LSP::CompletionList TextDocument_Completion(LSP::CompletionParams* params) = 0;
  virtual std::vector<LSP::Location> TextDocument_Declaration(LSP::TextDocumentPositionParams* params) = 0;
  virtual std::vector<LSP::Location> TextDocument_Definition(LSP::TextDocumentPositionParams* params) = 0;
  virtual std::vector<LSP::Location> TextDocument_TypeDefinition(LSP::TextDocumentPositionParams* params) = 0;
  virtual std::vector<LSP::Location> TextDocument_Implementation(LSP::TextDocumentPositionParams* params) = 0;
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

 protected:
  ~OlderLanguageServer() = default;
};

}  // namespace older_host

namespace {

using namespace connection_test;
using transport_test::FakeStart;
using transport_test::WaitFor;

constexpr char kName[] = "diagnostics";
constexpr char kUri[] = "file:///work/a.cpp";
// Each scripted result holds a blank outside its strings, so that Windows launches quote
// the argument whole instead of taking its quotation marks as the caller's own quoting.
constexpr char kProvider[] =
    R"(result=initialize:{"capabilities": {"diagnosticProvider":{"interFileDependencies":false,"workspaceDiagnostics":false}}})";
constexpr char kFullReport[] =
    R"(result=textDocument/diagnostic:{"kind": "full","resultId":"r7","items":[{"range":{"start":{"line":4,"character":1},"end":{"line":4,"character":3}},"severity":2,"code":12,"source":"json","message":"Trailing comma"}]})";


bool EndsWith(const std::string& text, const std::string& end) {
  return text.size() >= end.size() && text.compare(text.size() - end.size(), end.size(), end) == 0;
}

LSP::DidOpenTextDocumentParams Opened(const std::string& text) {
  LSP::DidOpenTextDocumentParams params;
  params.textDocument.uri = kUri;
  params.textDocument.languageId = "cpp";
  params.textDocument.version = 1;
  params.textDocument.text = text;
  return params;
}

LSP::DidChangeTextDocumentParams Changed(const std::string& text) {
  LSP::DidChangeTextDocumentParams params;
  params.textDocument.uri = kUri;
  params.textDocument.version = 2;
  params.contentChanges.emplace_back();
  params.contentChanges.back().text = text;
  return params;
}

class ConnectionDiagnostics : public ::testing::Test {
 protected:
  void SetUp() override { TraceLog::Clear(); }
  void TearDown() override { Dispose(kName); }

  xLanguageServer* Started(std::vector<std::string> directives) { return StartedFake(kName, std::move(directives)); }

  static bool Moves(xLanguageServer& server, int from) {
    return WaitFor([&] { return server.DiagnosticsVersion() != from; });
  }
};

TEST_F(ConnectionDiagnostics, PublicationsFollowTheDocumentAndPullingWithoutAProviderSendsNothing) {
  xLanguageServer* server = Started({"diagnose"});
  int before = server->DiagnosticsVersion();
  auto open = Opened("int a;\nint b = error;\n");
  server->TextDocument_DidOpen(&open);
  ASSERT_TRUE(Moves(*server, before));

  auto stored = server->TextDocument_Diagnostics(kUri);
  ASSERT_EQ(stored.size(), 1u);
  EXPECT_EQ(stored[0].range.start.line, 1);
  EXPECT_EQ(stored[0].severity, 1);
  EXPECT_EQ(stored[0].message, "found error");
  EXPECT_EQ(stored[0].codeText, "fake-error");
  EXPECT_TRUE(server->TextDocument_Diagnostics(nullptr).empty());
  EXPECT_TRUE(server->TextDocument_PullDiagnostics(nullptr).empty());

  LSP::TextDocumentIdentifier document;
  document.uri = kUri;
  EXPECT_EQ(server->TextDocument_PullDiagnostics(&document).size(), 1u);
  EXPECT_EQ(SentBody("textDocument/diagnostic"), "");

  int published = server->DiagnosticsVersion();
  auto fix = Changed("int a;\nint b = 2;\n");
  server->TextDocument_DidChange(&fix);
  ASSERT_TRUE(Moves(*server, published));
  EXPECT_TRUE(server->TextDocument_Diagnostics(kUri).empty());
}

TEST_F(ConnectionDiagnostics, PullingStoresAFullReportAndSendsItsIdBack) {
  xLanguageServer* server = Started({kProvider, kFullReport});
  LSP::TextDocumentIdentifier document;
  document.uri = kUri;
  int before = server->DiagnosticsVersion();

  auto pulled = server->TextDocument_PullDiagnostics(&document);
  ASSERT_EQ(pulled.size(), 1u);
  EXPECT_EQ(pulled[0].message, "Trailing comma");
  EXPECT_EQ(pulled[0].range.start.line, 4);
  EXPECT_EQ(pulled[0].code, 12);
  EXPECT_EQ(pulled[0].codeText, "12");
  EXPECT_TRUE(EndsWith(SentBody("textDocument/diagnostic"),
                       R"("method":"textDocument/diagnostic","params":{"textDocument":{"uri":"file:///work/a.cpp"}}})"));
  EXPECT_NE(server->DiagnosticsVersion(), before);
  EXPECT_EQ(server->TextDocument_Diagnostics(kUri).size(), 1u);

  TraceLog::Clear();
  server->TextDocument_PullDiagnostics(&document);
  EXPECT_NE(SentBody("textDocument/diagnostic").find(R"("previousResultId":"r7")"), std::string::npos);
}

TEST_F(ConnectionDiagnostics, AnUnchangedReportReturnsTheStoredList) {
  xLanguageServer* server =
      Started({"diagnose", kProvider, R"(result=textDocument/diagnostic:{"kind": "unchanged","resultId":"r1"})"});
  int before = server->DiagnosticsVersion();
  auto open = Opened("error\n");
  server->TextDocument_DidOpen(&open);
  ASSERT_TRUE(Moves(*server, before));
  LSP::TextDocumentIdentifier document;
  document.uri = kUri;
  auto pulled = server->TextDocument_PullDiagnostics(&document);
  ASSERT_EQ(pulled.size(), 1u);
  EXPECT_EQ(pulled[0].message, "found error");
}

// Drives a connection through the older declaration, as an older host's code does. The
// type checker of the undefined-behaviour sanitizer would rightly object to the cast
// type; calling through the slots regardless is the very point here.
__attribute__((no_sanitize("vptr"))) void UseAsOlderHost(older_host::OlderLanguageServer* older,
                                                          LSP::DidOpenTextDocumentParams& open) {
  ASSERT_TRUE(older->Start(xServerInitialise()));
  EXPECT_TRUE(older->IsRunning());
  EXPECT_GT(older->Id(), 0);
  older->TextDocument_DidOpen(&open);
  LSP::TextDocumentPositionParams at;
  at.textDocument.uri = kUri;
  EXPECT_EQ(older->TextDocument_Hover(&at).contents.value, "old host");
  EXPECT_FALSE(older->HaveErrors());
  EXPECT_TRUE(older->Shutdown());
  EXPECT_TRUE(older->Exit());
}

// A host compiled against the interface without the diagnostics slots still reaches every
// operation it knows at its old place.
TEST_F(ConnectionDiagnostics, AHostBuiltBeforeTheNewSlotsStillWorks) {
  xServerStart start = FakeStart({R"(result=textDocument/hover:{"contents": "old host"})"}, 2000,
                                 LSP::TraceLevel::Messages);
  start.name = kName;
  auto open = Opened("int a;\n");
  UseAsOlderHost(reinterpret_cast<older_host::OlderLanguageServer*>(Vexil_Start(start)), open);
  EXPECT_EQ(Vexil_Have(kName), nullptr);
}

}  // namespace
