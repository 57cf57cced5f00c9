// Uses the protocol model, the language table, the URI functions and the text helpers
// through the shared library alone: writing an initialize request, reading a completion
// reply and sending an item back, looking up ids, editing a text.
#include <gtest/gtest.h>

#include <filesystem>
#include <string>

#include "vexil/client/languages.h"
#include "vexil/client/uri.h"
#include "vexil/client/workspace_edits.h"
#include "vexil/protocol/document_features.h"
#include "vexil/protocol/feature_params.h"
#include "vexil/protocol/feature_results.h"
#include "vexil/protocol/initialize.h"

TEST(ProtocolExports, InitializeRequestIsWrittenThroughTheLibrary) {
  LSP::InitializeParams params(9, FileToUri("/srv/project"), LSP::TraceLevel::Off,
                               LSP::InitializationOptions(R"({"initializationOptions":{"a":1}})"));
  params.workspaceFolders.emplace_back(params.rootUri, "project");
  const std::string json = LSP::ToJsonText(params);
  EXPECT_EQ(json.rfind(R"({"processId":9,"rootUri":"file:///srv/project","initializationOptions":{"a":1},)", 0), 0u);
  EXPECT_NE(json.find(R"("workspaceFolders":[{"uri":"file:///srv/project","name":"project"}])"), std::string::npos);

  LSP::WorkspaceSymbolParams symbols;
  LSP::RequestMessage request("workspace/symbol", &symbols);
  EXPECT_NE(request.ToJSON().find(R"("params":{"query":""})"), std::string::npos);
}

TEST(ProtocolExports, CompletionReplyIsReadThroughTheLibrary) {
  LSP::xReader reader;
  ASSERT_TRUE(reader.Parse(R"({"jsonrpc":"2.0","id":4,"result":{"isIncomplete":true,"items":[{"label":"size","kind":2}]}})"));
  LSP::CompletionList list;
  LSP::ResponseMessage response(&list);
  response.Read(reader);
  EXPECT_EQ(response.id, 4);
  ASSERT_EQ(list.items.size(), 1u);
  EXPECT_EQ(list.items[0].label, "size");
  LSP::CompletionItemResolveParams resolve(list.items[0]);
  EXPECT_EQ(LSP::ToJsonText(resolve), R"({"label":"size","kind":2})");

  LSP::InitializeResult result;
  ASSERT_TRUE(reader.Parse(R"({"result":{"capabilities":{"renameProvider":{}}}})"));
  result.Read(reader);
  EXPECT_TRUE(result.capabilities.renameProvider);
}

TEST(ProtocolExports, LanguageTableAndUrisAreReachable) {
  const xLanguages languages;
  const xLanguages copy(languages);
  EXPECT_STREQ(copy.LanguageId("hpp"), "cpp");
  const std::string path = (std::filesystem::temp_directory_path() / "a b.c").string();
  EXPECT_EQ(FileToUri(path.c_str()).rfind("file:///", 0), 0u);
  EXPECT_EQ(UriToFile(FileToUri(path.c_str()).c_str()), path);

  std::string text = "a\xF0\x9F\x98\x80" "b";
  LSP::TextEdit edit;
  edit.range = LSP::Range(LSP::Position(0, 3), LSP::Position(0, 4));
  edit.newText = "c";
  std::string error;
  EXPECT_TRUE(LSP::ApplyTextEdits(text, {edit}, error));
  EXPECT_EQ(LSP::PositionToOffset(text, LSP::Position(0, 3)), 5u);
  EXPECT_EQ(text, "a\xF0\x9F\x98\x80" "c");
  EXPECT_TRUE(LSP::ApplyWorkspaceEdit(LSP::WorkspaceEdit(), error));
}
