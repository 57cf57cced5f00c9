// Diagnostics through the host's interface: publications after didOpen and didChange, and
// the pull request with its result id (the slots hosts call them through: connection_slots_test).
#include <gtest/gtest.h>

#include <string>

#include "connection_test_support.h"

namespace {

using namespace connection_test;
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
  auto open = Opened(kUri, "int a;\nint b = error;\n");
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
  auto fix = Changed(kUri, "int a;\nint b = 2;\n");
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

}  // namespace
