// Uses the JSON layer, the message and protocol model, the server records, the language
// table, the URI and text helpers and the trace queue through the shared library alone.
#include <gtest/gtest.h>

#include <filesystem>
#include <string>
#include <utility>

#include "../client/edit_helpers.h"
#include "../protocol/reply_helpers.h"
#include "vexil/client/languages.h"
#include "vexil/client/uri.h"
#include "vexil/client/workspace_edits.h"
#include "vexil/host/records.h"
#include "vexil/host/trace.h"
#include "vexil/protocol/document_features.h"
#include "vexil/protocol/feature_params.h"
#include "vexil/protocol/feature_results.h"
#include "vexil/protocol/initialize.h"
#include "vexil/protocol/message.h"
#include "vexil/protocol/structures.h"

namespace {

// A result class of the host's own, built on the library's base.
class Locations : public LSP::Result {
 public:
  void Read(const LSP::xObject& value) override { location.Read(value); }
  using LSP::JsonObject::Read;
  void Write(LSP::xWriter&) override {}
  bool IsObject() override { return false; }
  LSP::Location location;
};

}  // namespace

TEST(ModelExports, RepliesAreReadAndRequestsWritten) {
  const std::string reply = R"({"jsonrpc":"2.0","id":"5","result":{"uri":"file:///a.c",)"
                            R"("range":{"start":{"line":1,"character":2},"end":{"line":1,"character":4}}}})";
  Locations result;
  EXPECT_EQ(vexil_test::ReadReply(reply, result).id, 5);
  EXPECT_EQ(result.location.range.end.character, 4);

  LSP::CompletionList list;
  vexil_test::ReadReply(
      R"({"jsonrpc":"2.0","id":4,"result":{"isIncomplete":true,"items":[{"label":"size","kind":2}]}})", list);
  ASSERT_EQ(list.items.size(), 1u);
  LSP::CompletionItemResolveParams resolve(list.items[0]);
  EXPECT_EQ(LSP::ToJsonText(resolve), R"({"label":"size","kind":2})");
  LSP::xReader reader;
  LSP::InitializeResult initialized;
  ASSERT_TRUE(reader.Parse(R"({"result":{"capabilities":{"renameProvider":{}}}})"));
  initialized.Read(reader);
  EXPECT_TRUE(initialized.capabilities.renameProvider);

  LSP::InitializeParams params(9, FileToUri("/srv/project"), LSP::TraceLevel::Off,
                               LSP::InitializationOptions(R"({"initializationOptions":{"a":1}})"));
  params.workspaceFolders.emplace_back(params.rootUri, "project");
  const std::string json = LSP::ToJsonText(params);
  EXPECT_EQ(json.rfind(R"({"processId":9,"rootUri":"file:///srv/project","initializationOptions":{"a":1},)", 0), 0u);
  EXPECT_NE(json.find(R"("workspaceFolders":[{"uri":"file:///srv/project","name":"project"}])"), std::string::npos);
  LSP::WorkspaceSymbolParams symbols;
  EXPECT_NE(LSP::RequestMessage("workspace/symbol", &symbols).ToJSON().find(R"("params":{"query":""})"), std::string::npos);
  EXPECT_EQ(LSP::NotificationMessage("textDocument/didClose", nullptr).ToJSON(),
            R"({"jsonrpc":"2.0","method":"textDocument/didClose"})");
  LSP::TextDocumentIdentifier document("file:///a.c");
  LSP::CancelParams cancel(3);
  EXPECT_EQ(LSP::ToJsonText(document) + LSP::ToJsonText(cancel), R"({"uri":"file:///a.c"}{"id":3})");
}

TEST(ModelExports, ErrorsCrossTheLibraryBoundary) {
#if defined(_WIN32)
  GTEST_SKIP() << "the DLL links libgcc statically (it imports only system DLLs), so its "
                  "exceptions cannot unwind into another module";
#endif
  LSP::xReader reader;
  EXPECT_FALSE(reader.Parse("{"));
  EXPECT_FALSE(reader.Error().empty());
  ASSERT_TRUE(reader.Parse(R"({"v":[1.5],"s":1})"));
  EXPECT_THROW(reader.Root().Integers("v"), AssertException);
  EXPECT_THROW(reader.Root().String("s"), std::exception);
  EXPECT_THROW(reader.Object("missing"), std::exception);
}

// The records a host builds, copies and moves.
TEST(ModelExports, ServerRecordsAreValueTypes) {
  xServerStart start;
  start.executable = "clangd";
  start.name = "cpp";
  xServerStart copy(start);
  xServerStart moved(std::move(copy));
  copy = moved;
  copy = copy;
  EXPECT_EQ(copy.executable + moved.name, "clangdcpp");

  xServerInitialise initialise;
  initialise.workspaceFolders.emplace_back("file:///src", "src");
  xServerInitialise other;
  other.workspaceFolders.resize(3);
  other = initialise;
  xServerInitialise taken(std::move(other));
  ASSERT_EQ(taken.workspaceFolders.size(), 1u);
  EXPECT_EQ(taken.workspaceFolders[0].uri, "file:///src");
}

TEST(ModelExports, LanguageTableUrisTextsAndTraceQueueAreReachable) {
  const xLanguages languages;
  const xLanguages copy(languages);
  EXPECT_STREQ(copy.LanguageId("hpp"), "cpp");
  const std::string path = (std::filesystem::temp_directory_path() / "a b.c").string();
  EXPECT_EQ(UriToFile(FileToUri(path.c_str()).c_str()), path);

  std::string text = "a\xF0\x9F\x98\x80" "b";
  std::string error;
  EXPECT_TRUE(LSP::ApplyTextEdits(text, {vexil_test::Edit(0, 3, 0, 4, "c")}, error));
  EXPECT_EQ(LSP::PositionToOffset(text, LSP::Position(0, 3)), 5u);
  EXPECT_EQ(text, "a\xF0\x9F\x98\x80" "c");
  EXPECT_TRUE(LSP::ApplyWorkspaceEdit(LSP::WorkspaceEdit(), error));

  xTraceEvent::Write(TraceType::Line, "Error", "message", "detail");
  xTraceEvent event;
  ASSERT_TRUE(xTraceEvent::queue().TryPop(event));
  EXPECT_EQ(event.text, "message\ndetail");
  EXPECT_EQ(TraceToString(LSP::TraceLevel::Verbose), "verbose");
}
