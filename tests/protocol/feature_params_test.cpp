// The params of every feature request and notification, as the exact texts servers parse.
#include <gtest/gtest.h>

#include "reply_helpers.h"
#include "vexil/protocol/feature_params.h"

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

TEST(FeatureParams, PositionRequestsWriteDocumentPositionThenTheirOwnMembers) {
  auto position = AtPosition<LSP::TextDocumentPositionParams>(3, 7);
  EXPECT_EQ(Json(position), std::string("{") + kDocument + R"(,"position":{"line":3,"character":7}})");

  auto completion = AtPosition<LSP::CompletionParams>(1, 2);
  EXPECT_EQ(Json(completion), std::string("{") + kDocument +
                                  R"(,"position":{"line":1,"character":2},"context":{"triggerKind":1}})");
  completion.context.triggerKind = 2;
  completion.context.triggerCharacter = ".";
  EXPECT_EQ(Json(completion), std::string("{") + kDocument +
                                  R"(,"position":{"line":1,"character":2},"context":{"triggerKind":2,"triggerCharacter":"."}})");

  auto references = AtPosition<LSP::ReferenceParams>(0, 0);
  references.context.includeDeclaration = true;
  EXPECT_EQ(Json(references), std::string("{") + kDocument +
                                  R"(,"position":{"line":0,"character":0},"context":{"includeDeclaration":true}})");

  auto rename = AtPosition<LSP::RenameParams>(4, 5);
  rename.newName = "Limit";
  EXPECT_EQ(Json(rename), std::string("{") + kDocument + R"(,"position":{"line":4,"character":5},"newName":"Limit"})");
}

TEST(FeatureParams, DocumentRequestsAndNotificationsWriteExactlyTheirMembers) {
  auto symbols = WithDocument<LSP::DocumentSymbolParams>();
  auto save = WithDocument<LSP::DidSaveTextDocumentParams>();
  auto close = WithDocument<LSP::DidCloseTextDocumentParams>();
  const std::string documentOnly = std::string("{") + kDocument + "}";
  EXPECT_EQ(Json(symbols), documentOnly);
  EXPECT_EQ(Json(save), documentOnly);
  EXPECT_EQ(Json(close), documentOnly);

  auto formatting = WithDocument<LSP::DocumentFormattingParams>();
  formatting.options.tabSize = 2;
  EXPECT_EQ(Json(formatting), std::string("{") + kDocument + R"(,"options":{"tabSize":2,"insertSpaces":true}})");

  auto rangeFormatting = WithDocument<LSP::DocumentRangeFormattingParams>();
  rangeFormatting.range = LSP::Range(LSP::Position(1, 0), LSP::Position(2, 0));
  rangeFormatting.options.insertSpaces = false;
  EXPECT_EQ(Json(rangeFormatting),
            std::string("{") + kDocument +
                R"(,"range":{"start":{"line":1,"character":0},"end":{"line":2,"character":0}},)"
                R"("options":{"tabSize":4,"insertSpaces":false}})");

  LSP::DidOpenTextDocumentParams open;
  open.textDocument.uri = "file:///a.c";
  open.textDocument.languageId = "c";
  open.textDocument.version = 1;
  EXPECT_EQ(Json(open), R"({"textDocument":{"uri":"file:///a.c","languageId":"c","version":1,"text":""}})");

  LSP::DidChangeTextDocumentParams change;
  change.textDocument = LSP::VersionedTextDocumentIdentifier("file:///a.c", 2);
  change.contentChanges.resize(2);
  change.contentChanges[0].range.reset(new LSP::Range(LSP::Position(0, 1), LSP::Position(0, 2)));
  change.contentChanges[0].text = "x";
  change.contentChanges[1].text = "whole";
  EXPECT_EQ(Json(change), R"({"textDocument":{"uri":"file:///a.c","version":2},"contentChanges":[)"
                          R"({"range":{"start":{"line":0,"character":1},"end":{"line":0,"character":2}},"text":"x"},)"
                          R"({"text":"whole"}]})");
}

TEST(FeatureParams, WorkspaceSymbolQueryIsWrittenEvenWhenEmpty) {
  LSP::WorkspaceSymbolParams params;
  EXPECT_EQ(Json(params), R"({"query":""})");
  params.query = "Rect";
  LSP::RequestMessage request("workspace/symbol", &params);
  request.id = 5;
  EXPECT_EQ(request.ToJSON(), R"({"jsonrpc":"2.0","id":5,"method":"workspace/symbol","params":{"query":"Rect"}})");
}

}  // namespace
