// Uses the JSON layer and the message model through the shared library alone: reading a
// reply, writing a request, and catching the library's assertion type across the boundary.
#include <gtest/gtest.h>

#include "vexil/protocol/message.h"
#include "vexil/protocol/structures.h"

namespace {

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
  LSP::xReader reader;
  ASSERT_TRUE(reader.Parse(R"({"jsonrpc":"2.0","id":"5","result":{"uri":"file:///a.c",)"
                           R"("range":{"start":{"line":1,"character":2},"end":{"line":1,"character":4}}}})"));
  Locations result;
  LSP::ResponseMessage response(&result);
  response.Read(reader);
  EXPECT_EQ(response.id, 5);
  EXPECT_EQ(result.location.uri, "file:///a.c");
  EXPECT_EQ(result.location.range.end.character, 4);

  LSP::TextDocumentIdentifier document("file:///a.c");
  LSP::NotificationMessage notification("textDocument/didClose", nullptr);
  EXPECT_EQ(notification.ToJSON(), R"({"jsonrpc":"2.0","method":"textDocument/didClose"})");
  EXPECT_EQ(LSP::ToJsonText(document), R"({"uri":"file:///a.c"})");
  LSP::CancelParams cancel(3);
  EXPECT_EQ(LSP::ToJsonText(cancel), R"({"id":3})");
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
