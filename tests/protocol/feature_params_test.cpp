// The params of every feature request and notification, as the exact texts servers parse;
// what a server sent goes back as it came.
#include <gtest/gtest.h>

#include "reply_helpers.h"
#include "vexil/protocol/call_hierarchy.h"
#include "vexil/protocol/diagnostics.h"
#include "vexil/protocol/document_features.h"
#include "vexil/protocol/feature_params.h"
#include "vexil/protocol/workspace_notifications.h"

namespace {

const char kDocument[] = R"("textDocument":{"uri":"file:///a.c"})";

template <typename T>
T WithDocument() {
  T params;
  params.textDocument.uri = "file:///a.c";
  return params;
}

template <typename T>
T AtPosition(int line, int character) {
  T params = WithDocument<T>();
  params.position = LSP::Position(line, character);
  return params;
}

std::string Json(LSP::JsonObject& value) { return LSP::ToJsonText(value); }

TEST(FeatureParams, RequestsAndNotificationsWriteExactlyTheirMembers) {
  // A code action's context gives diagnostics back in the protocol's shape: one as published
  // (kept verbatim, "data" and all), one built by the host.
  LSP::PublishDiagnosticsParams published;
  const std::string sent = R"({"range":{"start":{"line":1,"character":2},"end":{"line":1,"character":5}},)"
                           R"("severity":1,"code":"E1","source":"lint","message":"bad","data":{"fix":7}})";
  LSP::xReader reader;
  ASSERT_TRUE(reader.Parse(R"({"params":{"uri":"file:///a.c","diagnostics":[)" + sent + "]}}"));
  published.Read(reader);
  LSP::Diagnostic built;
  built.range = LSP::Range(LSP::Position(3, 0), LSP::Position(3, 1));
  built.code = 42;
  built.message = "m";
  auto actions = WithDocument<LSP::CodeActionParams>();
  actions.range = built.range;
  actions.context.diagnostics = {published.diagnostics[0], built};
  actions.context.only = {"quickfix"};
  auto position = AtPosition<LSP::TextDocumentPositionParams>(3, 7);
  auto completion = AtPosition<LSP::CompletionParams>(1, 2);
  auto triggered = AtPosition<LSP::CompletionParams>(1, 2);
  triggered.context.triggerKind = 2;
  triggered.context.triggerCharacter = ".";
  auto references = AtPosition<LSP::ReferenceParams>(0, 0);
  references.context.includeDeclaration = true;
  auto rename = AtPosition<LSP::RenameParams>(4, 5);
  rename.newName = "Limit";
  auto symbols = WithDocument<LSP::DocumentSymbolParams>();
  auto save = WithDocument<LSP::DidSaveTextDocumentParams>();
  auto close = WithDocument<LSP::DidCloseTextDocumentParams>();
  auto formatting = WithDocument<LSP::DocumentFormattingParams>();
  formatting.options.tabSize = 2;
  auto rangeFormatting = WithDocument<LSP::DocumentRangeFormattingParams>();
  rangeFormatting.range = LSP::Range(LSP::Position(1, 0), LSP::Position(2, 0));
  rangeFormatting.options.insertSpaces = false;
  LSP::DidOpenTextDocumentParams open;
  open.textDocument.uri = "file:///a.c";
  open.textDocument.languageId = "c";
  open.textDocument.version = 1;
  LSP::DidChangeTextDocumentParams change;
  change.textDocument = LSP::VersionedTextDocumentIdentifier("file:///a.c", 2);
  change.contentChanges.resize(2);
  change.contentChanges[0].range.reset(new LSP::Range(LSP::Position(0, 1), LSP::Position(0, 2)));
  change.contentChanges[0].text = "x";
  change.contentChanges[1].text = "whole";
  LSP::ExecuteCommandParams execute;
  execute.command = "run";
  auto selection = WithDocument<LSP::SelectionRangeParams>();
  selection.positions = {LSP::Position(1, 2), LSP::Position(3, 4)};
  auto hints = WithDocument<LSP::InlayHintParams>();
  hints.range = LSP::Range(LSP::Position(0, 0), LSP::Position(9, 0));
  auto willSave = WithDocument<LSP::WillSaveTextDocumentParams>();
  willSave.reason = 3;
  LSP::DidChangeConfigurationParams configuration;
  LSP::DidChangeWorkspaceFoldersParams folders;
  folders.event.added.emplace_back("file:///b", "b");
  LSP::CompletionItemResolveParams resolveBuilt;
  resolveBuilt.item.label = "push_back";
  LSP::CallHierarchyCallsParams callsBuilt;
  callsBuilt.item.name = "f";
  callsBuilt.item.kind = 12;
  callsBuilt.item.uri = "file:///a.c";
  LSP::WorkspaceSymbolParams query;  // written even when empty
  LSP::ApplyWorkspaceEditResult answer;
  answer.failureReason = "read-only";
  const std::string document = std::string("{") + kDocument;
  const std::pair<LSP::JsonObject*, std::string> rows[] = {
      {&position, document + R"(,"position":{"line":3,"character":7}})"},
      {&completion, document + R"(,"position":{"line":1,"character":2},"context":{"triggerKind":1}})"},
      {&triggered, document + R"(,"position":{"line":1,"character":2},"context":{"triggerKind":2,"triggerCharacter":"."}})"},
      {&references, document + R"(,"position":{"line":0,"character":0},"context":{"includeDeclaration":true}})"},
      {&rename, document + R"(,"position":{"line":4,"character":5},"newName":"Limit"})"},
      {&symbols, document + "}"},
      {&save, document + "}"},
      {&close, document + "}"},
      {&formatting, document + R"(,"options":{"tabSize":2,"insertSpaces":true}})"},
      {&rangeFormatting, document + R"(,"range":{"start":{"line":1,"character":0},"end":{"line":2,"character":0}},)"
                                    R"("options":{"tabSize":4,"insertSpaces":false}})"},
      {&open, R"({"textDocument":{"uri":"file:///a.c","languageId":"c","version":1,"text":""}})"},
      {&change, R"({"textDocument":{"uri":"file:///a.c","version":2},"contentChanges":[)"
                R"({"range":{"start":{"line":0,"character":1},"end":{"line":0,"character":2}},"text":"x"},)"
                R"({"text":"whole"}]})"},
      {&execute, R"({"command":"run"})"},
      {&selection, document + R"(,"positions":[{"line":1,"character":2},{"line":3,"character":4}]})"},
      {&hints, document + R"(,"range":{"start":{"line":0,"character":0},"end":{"line":9,"character":0}}})"},
      {&willSave, document + R"(,"reason":3})"},
      {&configuration, R"({"settings":null})"},
      {&folders, R"({"event":{"added":[{"uri":"file:///b","name":"b"}],"removed":[]}})"},
      {&resolveBuilt, R"({"label":"push_back"})"},
      {&callsBuilt, R"({"item":{"name":"f","kind":12,"uri":"file:///a.c","range":{"start":{"line":0,"character":0},)"
                    R"("end":{"line":0,"character":0}},"selectionRange":{"start":{"line":0,"character":0},)"
                    R"("end":{"line":0,"character":0}}}})"},
      {&answer, R"({"applied":false,"failureReason":"read-only"})"},
      {&query, R"({"query":""})"},
      {&actions, document + R"(,"range":{"start":{"line":3,"character":0},"end":{"line":3,"character":1}},)"
                            R"("context":{"diagnostics":[)" + sent +
                     R"(,{"range":{"start":{"line":3,"character":0},"end":{"line":3,"character":1}},)"
                     R"("code":42,"message":"m"}],"only":["quickfix"]}})"},
  };
  for (const auto& [params, expected] : rows) EXPECT_EQ(Json(*params), expected) << expected;

  execute.arguments = R"([{"file":"a.c"},2])";
  configuration.settings = R"({"pylsp":{"plugins":{}}})";
  EXPECT_EQ(Json(execute), R"({"command":"run","arguments":[{"file":"a.c"},2]})");
  EXPECT_EQ(Json(configuration), R"({"settings":{"pylsp":{"plugins":{}}}})");
  configuration.settings = "{pylsp";
  EXPECT_EQ(vexil_test::ThrownText([&] { Json(configuration); }),
            "Invalid JSON for settings: Missing a name for object member.");
}

}  // namespace
