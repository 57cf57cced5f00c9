// A whole clangd session through the shared library: start, every feature call with the
// answer the example project calls for, document changes, shutdown and exit.
#include <gtest/gtest.h>

#include <map>
#include <set>

#include "e2e_support.h"
#include "vexil_test/support.h"

namespace {

using namespace e2e;

bool HasLabel(const LSP::CompletionList& list, const std::string& piece) {
  return std::any_of(list.items.begin(), list.items.end(),
                     [&](const LSP::CompletionItem& item) { return item.label.find(piece) != std::string::npos; });
}

std::set<std::string> Names(const std::vector<LSP::SymbolInformation>& symbols) {
  std::set<std::string> names;
  for (const LSP::SymbolInformation& symbol : symbols) {
    names.insert(symbol.name);
    for (const std::string& child : Names(symbol.children)) names.insert(child);
  }
  return names;
}

class ClangdSession : public ::testing::Test {
 protected:
  void SetUp() override {
    server = Vexil_Start(StartRecord(project, "clangd-session"));
    ASSERT_TRUE(server->Start(InitRecord(project)));
    for (const char* file : {"shapes.h", "shapes.cpp", "main.cpp"}) Open(*server, project, file);
    ASSERT_TRUE(AwaitIndexed());
  }
  void TearDown() override {
    if (Vexil_Have("clangd-session") && Kill(*server)) server->Exit();
  }

  // clangd builds and indexes opened files in the background; until then completion falls
  // back to plain words and renames see one file. All five uses of Clamp found means ready.
  bool AwaitIndexed() {
    auto at = At(project, "main.cpp", clampCall);
    auto deadline = std::chrono::steady_clock::now() + std::chrono::seconds(60);
    while (server->TextDocument_References(&at).size() < 5) {
      if (std::chrono::steady_clock::now() > deadline) return false;
      std::this_thread::sleep_for(std::chrono::milliseconds(50));
    }
    return true;
  }

  Project project = Cpp();
  xLanguageServer* server = nullptr;
  // Clamp as main.cpp calls it.
  LSP::Position clampCall = Find(project, "main.cpp", "shapes::Clamp(", 8);
};

TEST_F(ClangdSession, NavigationFindsTheDeclarationsDefinitionsAndUsesOfTheExample) {
  auto at = At(project, "main.cpp", clampCall);
  LSP::Hover hover = server->TextDocument_Hover(&at);
  EXPECT_NE(hover.contents.value.find("function Clamp"), std::string::npos) << hover.contents.value;
  EXPECT_NE(hover.contents.value.find("int Clamp(int value, int low, int high)"), std::string::npos);
  EXPECT_EQ(hover.range.start.line, clampCall.line);

  std::vector<LSP::Location> definition = server->TextDocument_Definition(&at);
  ASSERT_EQ(definition.size(), 1u);
  EXPECT_TRUE(EndsWith(definition[0].uri, "/examples/cpp/shapes.cpp")) << definition[0].uri;
  EXPECT_EQ(definition[0].range.start.line, LineOf(project, "shapes.cpp", "int Clamp("));

  std::vector<LSP::Location> declaration = server->TextDocument_Declaration(&at);
  ASSERT_EQ(declaration.size(), 1u);
  EXPECT_TRUE(EndsWith(declaration[0].uri, "/examples/cpp/shapes.h"));
  EXPECT_EQ(declaration[0].range.start.line, LineOf(project, "shapes.h", "int Clamp("));

  // Declaration, definition, two calls in Scale and one in main.
  std::vector<LSP::Location> references = server->TextDocument_References(&at);
  std::map<std::string, int> perFile;
  for (const LSP::Location& location : references) ++perFile[UriToFile(location.uri.c_str())];
  EXPECT_EQ(perFile, (std::map<std::string, int>{
                         {Path(project, "main.cpp"), 1}, {Path(project, "shapes.cpp"), 3}, {Path(project, "shapes.h"), 1}}));

  auto variable = At(project, "main.cpp", Find(project, "main.cpp", "Report(rectangle)", 7));
  std::vector<LSP::Location> type = server->TextDocument_TypeDefinition(&variable);
  ASSERT_EQ(type.size(), 1u);
  EXPECT_EQ(type[0].range.start.line, LineOf(project, "shapes.h", "class Rectangle"));

  auto pureArea = At(project, "shapes.h", Find(project, "shapes.h", "virtual int Area", 12));
  std::vector<LSP::Location> implementations = server->TextDocument_Implementation(&pureArea);
  ASSERT_EQ(implementations.size(), 1u);
  EXPECT_EQ(implementations[0].range.start.line, LineOf(project, "shapes.h", "int Area() const override"));

  // Beyond the typed calls: what clangd announced, and a request the interface has no call for.
  LSP::ServerCapabilities capabilities = server->ServerCapabilities();
  EXPECT_TRUE(capabilities.documentHighlightProvider);
  EXPECT_EQ(capabilities.documentSync.change, 2);
  EXPECT_TRUE(capabilities.documentSync.openClose);
  EXPECT_NE(std::string(server->ServerCapabilitiesJson()).find(R"("documentHighlightProvider":true)"), std::string::npos);
  std::string highlights = server->Request("textDocument/documentHighlight", LSP::ToJsonText(at).c_str());
  EXPECT_EQ(StartLines(highlights), std::vector<int>{clampCall.line}) << highlights;
}

TEST_F(ClangdSession, AssistanceCompletesMembersAndShowsSignaturesAndSymbols) {
  auto member = At<LSP::CompletionParams>(project, "main.cpp", Find(project, "main.cpp", "rectangle.Scale", 10));
  LSP::CompletionList completion = server->TextDocument_Completion(&member);
  EXPECT_TRUE(HasLabel(completion, "Area"));
  EXPECT_TRUE(HasLabel(completion, "Perimeter"));
  EXPECT_TRUE(HasLabel(completion, "Scale"));

  auto inCall = At(project, "main.cpp", Find(project, "main.cpp", "shapes::Clamp(", 14));
  LSP::SignatureHelp help = server->TextDocument_Signature(&inCall);
  ASSERT_EQ(help.signatures.size(), 1u);
  EXPECT_EQ(help.signatures[0].label, "Clamp(int value, int low, int high) -> int");
  EXPECT_EQ(help.signatures[0].parameters.size(), 3u);
  EXPECT_EQ(help.activeParameter, 0);

  LSP::DocumentSymbolParams header;
  header.textDocument.uri = Uri(project, "shapes.h");
  std::set<std::string> names = Names(server->TextDocument_DocumentSymbol(&header));
  for (const char* name : {"shapes", "Shape", "Rectangle", "Perimeter", "Clamp"}) EXPECT_EQ(names.count(name), 1u) << name;

  LSP::WorkspaceSymbolParams query;
  query.query = "Rectangle";
  std::vector<LSP::SymbolInformation> found = server->TextDocument_WorkspaceSymbol(&query);
  EXPECT_TRUE(std::any_of(found.begin(), found.end(), [&](const LSP::SymbolInformation& symbol) {
    return symbol.name == "Rectangle" && EndsWith(symbol.location.uri, "/shapes.h") &&
           symbol.location.range.start.line == LineOf(project, "shapes.h", "class Rectangle");
  }));
  EXPECT_FALSE(server->HaveErrors());
}

TEST_F(ClangdSession, EditsFormatTheOddLayoutAndRenameEveryUse) {
  int printfLine = LineOf(project, "main.cpp", "std::printf");
  LSP::DocumentFormattingParams whole;
  whole.textDocument.uri = Uri(project, "main.cpp");
  whole.options.tabSize = 2;
  std::vector<LSP::TextEdit> edits = server->TextDocument_Formatting(&whole);
  // The three blanks after the format string become one.
  EXPECT_TRUE(std::any_of(edits.begin(), edits.end(), [&](const LSP::TextEdit& edit) {
    return edit.range.start.line == printfLine && edit.newText == " " &&
           edit.range.end.character - edit.range.start.character == 3;
  }));

  LSP::DocumentRangeFormattingParams report;
  report.textDocument.uri = whole.textDocument.uri;
  report.options.tabSize = 2;
  report.range = LSP::Range(LSP::Position(printfLine, 0), LSP::Position(printfLine + 1, 0));
  std::vector<LSP::TextEdit> ranged = server->TextDocument_RangeFormatting(&report);
  EXPECT_FALSE(ranged.empty());
  for (const LSP::TextEdit& edit : ranged) EXPECT_GE(edit.range.start.line, printfLine - 1);

  auto rename = At<LSP::RenameParams>(project, "main.cpp", clampCall);
  rename.newName = "Limit";
  LSP::WorkspaceEdit change = server->TextDocument_Rename(&rename);
  int renamed = 0;
  for (const LSP::TextDocumentEdit& document : change.documentChanges) {
    for (const LSP::TextEdit& edit : document.edits) renamed += edit.newText == "Limit";
  }
  EXPECT_EQ(change.documentChanges.size(), 3u);
  EXPECT_EQ(renamed, 5);
}

TEST_F(ClangdSession, ChangedTextIsWhatTheServerAnswersAboutUntilShutdownAndExit) {
  std::string text = ReadFile(Path(project, "main.cpp")) + "int twice() { return shapes::Clamp(2, 0, 9); }\n";
  LSP::DidChangeTextDocumentParams change;
  change.textDocument = LSP::VersionedTextDocumentIdentifier(Uri(project, "main.cpp"), 2);
  change.contentChanges.emplace_back();
  change.contentChanges.back().text = text;
  server->TextDocument_DidChange(&change);
  LSP::DidSaveTextDocumentParams save;
  save.textDocument.uri = change.textDocument.uri;
  server->TextDocument_DidSave(&save);

  auto at = At(project, "main.cpp", clampCall);
  EXPECT_EQ(server->TextDocument_References(&at).size(), 6u);
  LSP::DidCloseTextDocumentParams close;
  close.textDocument.uri = change.textDocument.uri;
  server->TextDocument_DidClose(&close);
  EXPECT_FALSE(server->HaveErrors());

  EXPECT_TRUE(server->Shutdown());
  EXPECT_TRUE(Exits(*server));
  EXPECT_EQ(Vexil_Have("clangd-session"), nullptr);
}

// clangd indexes a project with a compilation database in the background and reports
// its progress, but only to a client that announced work-done progress.
TEST(ClangdProgress, BackgroundIndexingReachesTheMessageHandler) {
  vexil_test::TempDirectory directory;
  Project project{directory.Path().string(), "clangd", "--log=error"};
  std::ofstream(directory / "a.cpp") << "int Twice(int value) { return 2 * value; }\n";
  std::ofstream(directory / "b.cpp") << "int Twice(int value);\nint Four() { return Twice(2); }\n";
  std::string database = "[";
  for (const char* file : {"a.cpp", "b.cpp"}) {
    database += std::string(database.size() > 1 ? "," : "") + R"({"directory":")" + project.directory +
                R"(","file":")" + file + R"(","command":"c++ -c )" + file + R"("})";
  }
  std::ofstream(directory / "compile_commands.json") << database << "]";

  struct Progress {
    static void Handler(void* user, const char* method, const char* id, const char* params) {
      Progress& self = *static_cast<Progress*>(user);
      if (id) self.server->Reply(id, "null");  // "window/workDoneProgress/create"
      if (std::string(method) == "$/progress" && std::string(params).find(R"("kind":"end")") != std::string::npos) {
        self.ended = true;
      }
    }
    xLanguageServer* server;
    std::atomic<bool> ended{false};
  } progress;
  progress.server = Vexil_Start(StartRecord(project, "clangd-progress"));
  EXPECT_TRUE(progress.server->Enable("progress"));
  progress.server->SetMessageHandler(&Progress::Handler, &progress);
  ASSERT_TRUE(progress.server->Start(InitRecord(project)));
  Open(*progress.server, project, "b.cpp");
  auto deadline = std::chrono::steady_clock::now() + std::chrono::seconds(60);
  while (!progress.ended && std::chrono::steady_clock::now() < deadline) {
    std::this_thread::sleep_for(std::chrono::milliseconds(20));
  }
  EXPECT_TRUE(progress.ended);
  EXPECT_TRUE(Kill(*progress.server) && progress.server->Exit());
}

}  // namespace
