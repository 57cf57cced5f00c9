// Whole sessions through the shared library: clangd's start, the feature calls with the
// answer the example project calls for (those the command-line test makes of clangd are
// checked there), pylsp's answers about the Python example and other servers beside it,
// answers about changed text, and clangd's death.
#include <gtest/gtest.h>

#include <map>
#include <set>

#include "e2e_support.h"
#include "vexil_test/support.h"

namespace {

using namespace e2e;

std::set<std::string> Names(const std::vector<LSP::SymbolInformation>& symbols) {
  std::set<std::string> names;
  for (const LSP::SymbolInformation& symbol : symbols) {
    names.insert(symbol.name);
    for (const std::string& child : Names(symbol.children)) names.insert(child);
  }
  return names;
}

std::string HoverText(xLanguageServer& server, const Project& project, const std::string& file,
                      const std::string& needle, std::size_t offset) {
  auto at = At(project, file, Find(project, file, needle, offset));
  return server.TextDocument_Hover(&at).contents.value;
}

// What pylsp answers about the Python example's geometry module, main.py open (its
// highlights, folds and diagnostics are the command-line test's).
void ExpectPylspAnswersAboutGeometry(xLanguageServer& server, const Project& project) {
  Open(server, project, "geometry.py");
  // clamp as main.py calls it (hovered below).
  auto call = At(project, "main.py", Find(project, "main.py", "print(clamp(", 6));
  std::vector<LSP::Location> definition = server.TextDocument_Definition(&call);
  ASSERT_EQ(definition.size(), 1u);
  EXPECT_TRUE(EndsWith(definition[0].uri, "/examples/python/geometry.py")) << definition[0].uri;
  EXPECT_EQ(definition[0].range.start.line, LineOf(project, "geometry.py", "def clamp"));

  // The definition and two calls in geometry.py, the import and one call in main.py.
  EXPECT_EQ(PerFile(server.TextDocument_References(&call)),
            (std::map<std::string, int>{{Path(project, "geometry.py"), 3}, {Path(project, "main.py"), 2}}));

  // What pylsp announced (its highlights and folds, and its diagnostics, are the
  // command-line test's).
  EXPECT_TRUE(server.ServerCapabilities().documentHighlightProvider);
  EXPECT_EQ(server.ServerCapabilities().documentSync.change, 2);

  auto member = At<LSP::CompletionParams>(project, "main.py", Find(project, "main.py", "rectangle.scale", 10));
  std::set<std::string> labels;
  for (const LSP::CompletionItem& item : server.TextDocument_Completion(&member).items) labels.insert(item.label);
  for (const char* label : {"area()", "scale(factor)"}) EXPECT_EQ(labels.count(label), 1u) << label;

  auto inCall = At(project, "main.py", Find(project, "main.py", "print(clamp(", 12));
  LSP::SignatureHelp help = server.TextDocument_Signature(&inCall);
  ASSERT_EQ(help.signatures.size(), 1u);
  EXPECT_EQ(help.signatures[0].label, "clamp(value, low, high)");

  auto module = Document<LSP::DocumentSymbolParams>(project, "geometry.py");
  std::map<std::string, int> symbolLines;
  for (const LSP::SymbolInformation& symbol : server.TextDocument_DocumentSymbol(&module)) {
    symbolLines[symbol.name] = symbol.location.range.start.line;
  }
  EXPECT_EQ(symbolLines["Rectangle"], LineOf(project, "geometry.py", "class Rectangle"));
  EXPECT_EQ(symbolLines["clamp"], LineOf(project, "geometry.py", "def clamp"));

  auto rename = At<LSP::RenameParams>(project, "main.py", call.position);
  rename.newName = "limit";
  LSP::WorkspaceEdit change = server.TextDocument_Rename(&rename);
  std::string renamed;  // pylsp replaces the whole text of each file
  for (const LSP::TextDocumentEdit& document : change.documentChanges)
    if (EndsWith(document.textDocument.uri, "/geometry.py") && !document.edits.empty()) renamed = document.edits[0].newText;
  ExpectHas(renamed, {"def limit(value, low, high):"});
  EXPECT_FALSE(server.HaveErrors());
}

// The steps share one session, started once: clangd takes long to index on a loaded machine.
// Beside it, a server whose command does not exist fails to start and leaves cleanly, and
// pylsp (answering about the geometry module in its first life) ends and starts again under
// its name, each answering for its own project; killed at the end, clangd gives empty
// results at once.
TEST(ClangdSession, AnswersEachFeatureBesideOtherServersThenAboutChangedTextUntilKilled) {
  Project project = Cpp();
  xServerStart start = StartRecord(project, "clangd-session");
  start.timeout = 60000;  // a wait for the dead server would be unmistakable
  xLanguageServer* server = Vexil_Start(start);
  ASSERT_TRUE(server->Start(InitRecord(project)));
  for (const char* file : {"shapes.h", "shapes.cpp", "main.cpp"}) Open(*server, project, file);
  // Clamp as main.cpp calls it.
  LSP::Position clampCall = Find(project, "main.cpp", "shapes::Clamp(", 8);
  // clangd builds and indexes opened files in the background; until then renames see one
  // file. All five uses of Clamp found means ready.
  auto at = At(project, "main.cpp", clampCall);
  ASSERT_TRUE(vexil_test::WaitFor([&] { return server->TextDocument_References(&at).size() >= 5; }, kPatience));

  // Each call that finds one place: the file and the text of its line.
  auto variable = At(project, "main.cpp", Find(project, "main.cpp", "Report(rectangle)", 7));
  auto pureArea = At(project, "shapes.h", Find(project, "shapes.h", "virtual int Area", 12));
  struct Found { const char* call; std::vector<LSP::Location> locations; const char* file; const char* line; };
  for (const Found& row : {Found{"definition", server->TextDocument_Definition(&at), "shapes.cpp", "int Clamp("},
                           Found{"declaration", server->TextDocument_Declaration(&at), "shapes.h", "int Clamp("},
                           Found{"type", server->TextDocument_TypeDefinition(&variable), "shapes.h", "class Rectangle"},
                           Found{"implementation", server->TextDocument_Implementation(&pureArea), "shapes.h",
                                 "int Area() const override"}}) {
    ASSERT_EQ(row.locations.size(), 1u) << row.call;
    EXPECT_EQ(UriToFile(row.locations[0].uri.c_str()), Path(project, row.file)) << row.call;
    EXPECT_EQ(row.locations[0].range.start.line, LineOf(project, row.file, row.line)) << row.call;
  }

  // Declaration, definition, two calls in Scale and one in main.
  EXPECT_EQ(PerFile(server->TextDocument_References(&at)),
            (std::map<std::string, int>{
                {Path(project, "main.cpp"), 1}, {Path(project, "shapes.cpp"), 3}, {Path(project, "shapes.h"), 1}}));

  // Assistance: signatures and symbols shown.
  auto inCall = At(project, "main.cpp", Find(project, "main.cpp", "shapes::Clamp(", 14));
  LSP::SignatureHelp help = server->TextDocument_Signature(&inCall);
  ASSERT_EQ(help.signatures.size(), 1u);
  EXPECT_EQ(help.signatures[0].label, "Clamp(int value, int low, int high) -> int");
  EXPECT_EQ(help.signatures[0].parameters.size(), 3u);
  EXPECT_EQ(help.activeParameter, 0);

  auto header = Document<LSP::DocumentSymbolParams>(project, "shapes.h");
  std::set<std::string> names = Names(server->TextDocument_DocumentSymbol(&header));
  for (const char* name : {"shapes", "Shape", "Rectangle", "Perimeter", "Clamp"}) EXPECT_EQ(names.count(name), 1u) << name;

  LSP::WorkspaceSymbolParams query;
  query.query = "Rectangle";
  std::vector<LSP::SymbolInformation> found = server->TextDocument_WorkspaceSymbol(&query);
  EXPECT_TRUE(std::any_of(found.begin(), found.end(), [&](const LSP::SymbolInformation& symbol) {
    return symbol.name == "Rectangle" && EndsWith(symbol.location.uri, "/shapes.h") &&
           symbol.location.range.start.line == LineOf(project, "shapes.h", "class Rectangle");
  }));

  // Edits: the odd layout formatted, every use renamed.
  int printfLine = LineOf(project, "main.cpp", "std::printf");
  auto whole = Document<LSP::DocumentFormattingParams>(project, "main.cpp");
  whole.options.tabSize = 2;
  std::vector<LSP::TextEdit> edits = server->TextDocument_Formatting(&whole);
  // The three blanks after the format string become one.
  EXPECT_TRUE(std::any_of(edits.begin(), edits.end(), [&](const LSP::TextEdit& edit) {
    return edit.range.start.line == printfLine && edit.newText == " " &&
           edit.range.end.character - edit.range.start.character == 3;
  }));

  auto report = Document<LSP::DocumentRangeFormattingParams>(project, "main.cpp");
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

  // clangd folds only from version 15 on; before, it refuses the method.
  auto folding = Document<LSP::FoldingRangeParams>(project, "shapes.cpp");
  std::vector<LSP::FoldingRange> folds = server->TextDocument_FoldingRange(&folding);
  if (server->ServerCapabilities().foldingRangeProvider) {
    EXPECT_TRUE(std::any_of(folds.begin(), folds.end(), [&](const LSP::FoldingRange& fold) {
      return fold.startLine == LineOf(project, "shapes.cpp", "int Clamp(") && fold.endLine > fold.startLine;
    }));
  } else {
    EXPECT_TRUE(folds.empty());
    EXPECT_STREQ(server->ErrorMessage(), "method not found");
  }

  Project nowhere = Cpp();
  nowhere.executable = "vexil-no-such-language-server";
  const std::size_t errorsBefore = vexil_test::TraceLog::Texts("Error").size();
  xLanguageServer* missing = Vexil_Start(StartRecord(nowhere, "missing"));
  EXPECT_FALSE(missing->Start(InitRecord(nowhere)));
  EXPECT_FALSE(missing->IsRunning());
  EXPECT_EQ(missing->Id(), -1);
  EXPECT_GT(vexil_test::TraceLog::Texts("Error").size(), errorsBefore);
  EXPECT_TRUE(missing->Exit());
  EXPECT_EQ(Vexil_Have("missing"), nullptr);
  const Project python = Python();
  for (int life = 0; life < 2; ++life) {
    SCOPED_TRACE("life " + std::to_string(life));
    xLanguageServer* pylsp = Vexil_Start(StartRecord(python, "beside-pylsp"));
    ASSERT_NE(server, pylsp);
    ASSERT_EQ(Vexil_Have("beside-pylsp"), pylsp);
    ASSERT_TRUE(pylsp->Start(InitRecord(python)));
    Open(*pylsp, python, "main.py");
    if (life == 0) ExpectPylspAnswersAboutGeometry(*pylsp, python);
    ExpectHas(HoverText(*server, project, "main.cpp", "shapes::Clamp(", 8),
              {"int Clamp(int value, int low, int high)"});
    ExpectHas(HoverText(*pylsp, python, "main.py", "print(clamp(", 6),
              {"clamp(value, low, high)", "Limit value to the range from low to high."});
    EXPECT_TRUE(pylsp->Shutdown());
    // Exit gives a server about a second to end and, when it has not, returns false and
    // leaves the connection usable: on a loaded machine a host (and a test) asks again.
    EXPECT_TRUE(vexil_test::WaitFor([&] { return pylsp->Exit(); }));
    EXPECT_EQ(Vexil_Have("beside-pylsp"), nullptr);
  }
  EXPECT_EQ(HoverText(*server, project, "main.cpp", "Report(rectangle)", 0).find("function Report"), 0u);

  // One more use, changed and saved: the answers are about the new text. (A misspelt call's
  // error, its quick fix and the list emptied once fixed are the command-line test's.)
  LSP::DidChangeTextDocumentParams edited;
  edited.textDocument = LSP::VersionedTextDocumentIdentifier(Uri(project, "main.cpp"), 2);
  edited.contentChanges.emplace_back();
  edited.contentChanges.back().text =
      vexil_test::ReadFile(Path(project, "main.cpp")) + "int twice() { return shapes::Clamp(2, 0, 9); }\n";
  server->TextDocument_DidChange(&edited);
  auto save = Document<LSP::DidSaveTextDocumentParams>(project, "main.cpp");
  server->TextDocument_DidSave(&save);
  EXPECT_TRUE(vexil_test::WaitFor([&] { return server->TextDocument_References(&at).size() == 6; }, kPatience));
  auto close = Document<LSP::DidCloseTextDocumentParams>(project, "main.cpp");
  server->TextDocument_DidClose(&close);
  EXPECT_FALSE(server->HaveErrors());

  ASSERT_TRUE(Kill(*server));
  auto before = std::chrono::steady_clock::now();
  EXPECT_EQ(HoverText(*server, project, "main.cpp", "shapes::Clamp(", 8), "");
  EXPECT_LT(std::chrono::steady_clock::now() - before, std::chrono::seconds(6));
  EXPECT_TRUE(server->HaveErrors());
  EXPECT_STREQ(server->ErrorMessage(), "A server read was requested but the server is not running.");
  EXPECT_TRUE(server->Shutdown());
  EXPECT_TRUE(server->Exit());
  EXPECT_EQ(Vexil_Have("clangd-session"), nullptr);
}

// clangd indexes a project with a compilation database in the background and reports
// its progress, but only to a client that announced work-done progress.
TEST(ClangdProgress, BackgroundIndexingReachesTheMessageHandler) {
  vexil_test::TempDirectory directory;
  Project project{directory.Path().string(), "clangd", "--log=error"};
  std::ofstream(directory / "a.cpp") << "int Twice(int value) { return 2 * value; }\n";
  std::ofstream(directory / "b.cpp") << "int Twice(int value);\nint Four() { return Twice(2); }\n";
  auto entry = [&](const char* file) {
    return R"({"directory":")" + project.directory + R"(","file":")" + file + R"(","command":"c++ -c )" + file + R"("})";
  };
  std::ofstream(directory / "compile_commands.json") << "[" << entry("a.cpp") << "," << entry("b.cpp") << "]";

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
  EXPECT_TRUE(vexil_test::WaitFor([&] { return progress.ended.load(); }, kPatience));
  EXPECT_TRUE(Kill(*progress.server) && progress.server->Exit());
}

}  // namespace
