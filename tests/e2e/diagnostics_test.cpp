// Diagnostics from real servers through the shared library: clangd's type error and
// pyflakes' undefined name (through pylsp) at the right line, and gone after the fix.
#include <gtest/gtest.h>

#include "e2e_support.h"

namespace {

using namespace e2e;

// The newest stored diagnostics once `condition` holds for them, or the last seen ones.
template <typename Condition>
std::vector<LSP::Diagnostic> StoredOnce(xLanguageServer& server, const std::string& uri, Condition condition) {
  auto deadline = std::chrono::steady_clock::now() + std::chrono::milliseconds(kTimeoutMs);
  std::vector<LSP::Diagnostic> stored = server.TextDocument_Diagnostics(uri.c_str());
  while (!condition(stored) && std::chrono::steady_clock::now() < deadline) {
    std::this_thread::sleep_for(std::chrono::milliseconds(20));
    stored = server.TextDocument_Diagnostics(uri.c_str());
  }
  return stored;
}

bool Any(const std::vector<LSP::Diagnostic>& list) { return !list.empty(); }
bool None(const std::vector<LSP::Diagnostic>& list) { return list.empty(); }

void OpenText(xLanguageServer& server, const std::string& uri, const char* language, const std::string& text) {
  LSP::DidOpenTextDocumentParams params;
  params.textDocument.uri = uri;
  params.textDocument.languageId = language;
  params.textDocument.version = 1;
  params.textDocument.text = text;
  server.TextDocument_DidOpen(&params);
}

void ChangeText(xLanguageServer& server, const std::string& uri, const std::string& text) {
  LSP::DidChangeTextDocumentParams params;
  params.textDocument.uri = uri;
  params.textDocument.version = 2;
  params.contentChanges.emplace_back();
  params.contentChanges.back().text = text;
  server.TextDocument_DidChange(&params);
}

// Opens `broken`, expects one error on `line` whose message holds `message`, then sends
// `fixed` and expects the list to empty while the version moves.
void ExpectErrorThenFix(const Project& project, const char* name, const char* language, const std::string& file,
                        const std::string& broken, const std::string& fixed, int line, const std::string& message) {
  xLanguageServer* server = Vexil_Start(StartRecord(project, name));
  ASSERT_TRUE(server->Start(InitRecord(project)));
  std::string uri = Uri(project, file);
  OpenText(*server, uri, language, broken);

  std::vector<LSP::Diagnostic> stored = StoredOnce(*server, uri, Any);
  ASSERT_EQ(stored.size(), 1u);
  EXPECT_EQ(stored[0].range.start.line, line);
  EXPECT_EQ(stored[0].severity, 1);
  EXPECT_NE(stored[0].message.find(message), std::string::npos) << stored[0].message;

  int before = server->DiagnosticsVersion();
  ChangeText(*server, uri, fixed);
  EXPECT_TRUE(StoredOnce(*server, uri, None).empty());
  EXPECT_NE(server->DiagnosticsVersion(), before);

  EXPECT_TRUE(server->Shutdown());
  EXPECT_TRUE(Exits(*server));
}

TEST(Diagnostics, ClangdReportsATypeErrorAndClearsItAfterTheFix) {
  ExpectErrorThenFix(Cpp(), "clangd-diagnostics", "cpp", "probe.cpp",
                     "#include \"shapes.h\"\n\nint Twice() {\n  int count = \"two\";\n  return count * 2;\n}\n",
                     "#include \"shapes.h\"\n\nint Twice() {\n  int count = 2;\n  return count * 2;\n}\n", 3,
                     "Cannot initialize a variable of type 'int'");
}

TEST(Diagnostics, PylspReportsAnUndefinedNameAndClearsItAfterTheFix) {
  ExpectErrorThenFix(Python(), "pylsp-diagnostics", "python", "probe.py",
                     "def area(width):\n    return widht * 2\n", "def area(width):\n    return width * 2\n", 1,
                     "undefined name 'widht'");
}

}  // namespace
