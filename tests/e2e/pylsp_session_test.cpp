// A pylsp session through the shared library over the Python example: the answers jedi
// gives about the geometry module, then shutdown and exit.
#include <gtest/gtest.h>

#include <map>
#include <set>

#include "e2e_support.h"

namespace {

using namespace e2e;

TEST(PylspSession, AnswersAboutTheGeometryModule) {
  Project project = Python();
  xLanguageServer* server = Vexil_Start(StartRecord(project, "pylsp-session"));
  ASSERT_TRUE(server->Start(InitRecord(project)));
  Open(*server, project, "geometry.py");
  Open(*server, project, "main.py");

  // clamp as main.py calls it (hovered beside the clangd session).
  auto call = At(project, "main.py", Find(project, "main.py", "print(clamp(", 6));
  std::vector<LSP::Location> definition = server->TextDocument_Definition(&call);
  ASSERT_EQ(definition.size(), 1u);
  EXPECT_TRUE(EndsWith(definition[0].uri, "/examples/python/geometry.py")) << definition[0].uri;
  EXPECT_EQ(definition[0].range.start.line, LineOf(project, "geometry.py", "def clamp"));

  // The definition and two calls in geometry.py, the import and one call in main.py.
  EXPECT_EQ(PerFile(server->TextDocument_References(&call)),
            (std::map<std::string, int>{{Path(project, "geometry.py"), 3}, {Path(project, "main.py"), 2}}));

  // What pylsp announced (its highlights and folds, and its diagnostics, are the
  // command-line test's).
  EXPECT_TRUE(server->ServerCapabilities().documentHighlightProvider);
  EXPECT_EQ(server->ServerCapabilities().documentSync.change, 2);

  auto member = At<LSP::CompletionParams>(project, "main.py", Find(project, "main.py", "rectangle.scale", 10));
  std::set<std::string> labels;
  for (const LSP::CompletionItem& item : server->TextDocument_Completion(&member).items) labels.insert(item.label);
  for (const char* label : {"area()", "scale(factor)"}) EXPECT_EQ(labels.count(label), 1u) << label;

  auto inCall = At(project, "main.py", Find(project, "main.py", "print(clamp(", 12));
  LSP::SignatureHelp help = server->TextDocument_Signature(&inCall);
  ASSERT_EQ(help.signatures.size(), 1u);
  EXPECT_EQ(help.signatures[0].label, "clamp(value, low, high)");

  auto module = Document<LSP::DocumentSymbolParams>(project, "geometry.py");
  std::map<std::string, int> symbolLines;
  for (const LSP::SymbolInformation& symbol : server->TextDocument_DocumentSymbol(&module)) {
    symbolLines[symbol.name] = symbol.location.range.start.line;
  }
  EXPECT_EQ(symbolLines["Rectangle"], LineOf(project, "geometry.py", "class Rectangle"));
  EXPECT_EQ(symbolLines["clamp"], LineOf(project, "geometry.py", "def clamp"));

  auto rename = At<LSP::RenameParams>(project, "main.py", call.position);
  rename.newName = "limit";
  LSP::WorkspaceEdit change = server->TextDocument_Rename(&rename);
  std::string renamed;  // pylsp replaces the whole text of each file
  for (const LSP::TextDocumentEdit& document : change.documentChanges)
    if (EndsWith(document.textDocument.uri, "/geometry.py") && !document.edits.empty()) renamed = document.edits[0].newText;
  ExpectHas(renamed, {"def limit(value, low, high):"});
  EXPECT_FALSE(server->HaveErrors());

  ShutDownAndExit(*server, "pylsp-session");
}

}  // namespace
