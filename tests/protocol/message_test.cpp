// The JSON-RPC envelope on the wire: exact member order, request ids from one
// process-wide counter (also under concurrent construction), and replies read back.
#include <gtest/gtest.h>

#include <algorithm>
#include <set>
#include <thread>
#include <vector>

#include "vexil/protocol/message.h"
#include "vexil/protocol/structures.h"

namespace {

// A result that records what it was given, to see whether the reply reached it.
class Recorded : public LSP::Result {
 public:
  void Read(const LSP::xObject& value) override { text = value.String("text"), reads++; }
  using LSP::JsonObject::Read;
  void Write(LSP::xWriter&) override {}
  std::string text;
  int reads = 0;
};

class PositionParams : public LSP::Params {
 public:
  void Write(LSP::xWriter& writer) override {
    writer.Object(document, true);
    writer.Object(position, true);
  }
  LSP::TextDocumentIdentifier document{"file:///a.c"};
  LSP::Position position{3, 7};
};

struct Reply {
  explicit Reply(const std::string& json) : response(&result) {
    EXPECT_TRUE(reader.Parse(json)) << reader.Error();
    response.Read(reader);
  }
  LSP::xReader reader;
  Recorded result;
  LSP::ResponseMessage response;
};

}  // namespace

TEST(Envelope, RequestsAndNotificationsInWireOrder) {
  PositionParams params;
  LSP::RequestMessage hover("textDocument/hover", &params);
  EXPECT_TRUE(hover.IsRequest());
  EXPECT_STREQ(hover.Name(), "request");
  EXPECT_EQ(hover.ToJSON(), "{\"jsonrpc\":\"2.0\",\"id\":" + std::to_string(hover.id) +
                                R"(,"method":"textDocument/hover","params":{"textDocument":{"uri":"file:///a.c"},)"
                                R"("position":{"line":3,"character":7}}})");

  LSP::RequestMessage shutdown("shutdown", nullptr);
  EXPECT_EQ(shutdown.ToJSON(), "{\"jsonrpc\":\"2.0\",\"id\":" + std::to_string(shutdown.id) + R"(,"method":"shutdown"})");
  LSP::RequestMessage nameless("", nullptr);
  EXPECT_EQ(nameless.ToJSON(), "{\"jsonrpc\":\"2.0\",\"id\":" + std::to_string(nameless.id) + "}");

  LSP::NotificationMessage exit("exit", nullptr);
  EXPECT_FALSE(exit.IsRequest());
  EXPECT_STREQ(exit.Name(), "request");
  EXPECT_EQ(exit.ToJSON(), R"({"jsonrpc":"2.0","method":"exit"})");
  LSP::CancelParams cancel(12);
  LSP::NotificationMessage cancelRequest("$/cancelRequest", &cancel);
  EXPECT_EQ(cancelRequest.ToJSON(), R"({"jsonrpc":"2.0","method":"$/cancelRequest","params":{"id":12}})");
  LSP::MessageBase base;
  EXPECT_EQ(base.ToJSON(), "");
}

TEST(Envelope, RequestIdsAreConsecutiveAndNotificationsTakeNone) {
  LSP::RequestMessage first("a", nullptr);
  LSP::NotificationMessage between("b", nullptr);
  LSP::RequestMessage second("c", nullptr);
  EXPECT_GE(first.id, 1);
  EXPECT_EQ(second.id, first.id + 1);
}

TEST(Envelope, RequestIdsStayUniqueUnderConcurrentConstruction) {
  constexpr int kThreads = 4;
  constexpr int kEach = 5000;
  std::vector<std::vector<int>> ids(kThreads);
  std::vector<std::thread> threads;
  for (int t = 0; t < kThreads; ++t)
    threads.emplace_back([&ids, t] {
      for (int i = 0; i < kEach; ++i) ids[t].push_back(LSP::RequestMessage("m", nullptr).id);
    });
  for (std::thread& thread : threads) thread.join();
  std::set<int> all;
  for (const std::vector<int>& some : ids) {
    EXPECT_TRUE(std::is_sorted(some.begin(), some.end()));
    all.insert(some.begin(), some.end());
  }
  EXPECT_EQ(all.size(), static_cast<size_t>(kThreads * kEach));
  EXPECT_EQ(*all.rbegin() - *all.begin() + 1, kThreads * kEach);
}

TEST(Envelope, RepliesAreReadIntoTheCallersResult) {
  Reply ok(R"({"jsonrpc":"2.0","id":4,"result":{"text":"hi"}})");
  EXPECT_EQ(ok.response.id, 4);
  EXPECT_EQ(ok.response.jsonrpc, "2.0");
  EXPECT_FALSE(ok.response.HaveError());
  EXPECT_EQ(ok.result.text, "hi");

  Reply stringId(R"({"jsonrpc":"2.0","id":"12","result":null})");
  EXPECT_EQ(stringId.response.id, 12);
  EXPECT_FALSE(stringId.response.HaveError());
  EXPECT_EQ(stringId.result.reads, 0);

  Reply notFound(R"({"jsonrpc":"2.0","id":3,"error":{"code":-32601,"message":"Unhandled method x"}})");
  EXPECT_TRUE(notFound.response.MethodNotFound());
  EXPECT_TRUE(notFound.response.HaveError());
  EXPECT_STREQ(notFound.response.ErrorMessage(), "Unhandled method x");

  Reply noCode(R"({"jsonrpc":"2.0","id":3,"error":{"message":"boom"}})");
  EXPECT_EQ(noCode.response.error.code, -1);
  EXPECT_TRUE(noCode.response.HaveError());
  EXPECT_FALSE(noCode.response.MethodNotFound());

  Reply notification(R"({"jsonrpc":"2.0","method":"window/logMessage","params":{}})");
  EXPECT_EQ(notification.response.id, -1);
  EXPECT_FALSE(notification.response.HaveError());
  EXPECT_STREQ(notification.response.ErrorMessage(), "");
}

TEST(Envelope, BadIdsRaiseConversionAndTypeErrors) {
  LSP::xReader reader;
  LSP::ResponseMessage response(nullptr);
  ASSERT_TRUE(reader.Parse(R"({"id":"x1"})"));
  EXPECT_THROW(response.Read(reader), std::invalid_argument);
  ASSERT_TRUE(reader.Parse(R"({"id":null})"));
  try {
    response.Read(reader);
    FAIL() << "no exception";
  } catch (const std::exception& e) {
    EXPECT_STREQ(e.what(), "Expecting a 'int' JSON object but found 'null' JSON object.");
  }
  ASSERT_TRUE(reader.Parse(R"({"id":1,"result":{"text":"no result object bound"}})"));
  EXPECT_NO_THROW(response.Read(reader));
  EXPECT_EQ(response.id, 1);
}
