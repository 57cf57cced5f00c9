// The JSON-RPC envelope on the wire: exact member order, request ids from one
// process-wide counter (also under concurrent construction), and replies read back.
#include <gtest/gtest.h>

#include <algorithm>
#include <set>
#include <thread>
#include <vector>

#include "reply_helpers.h"
#include "vexil/protocol/code_actions.h"
#include "vexil/protocol/feature_params.h"
#include "vexil/protocol/message.h"
#include "vexil/protocol/structures.h"

namespace {

using namespace vexil_test;

// A whole reply read into a result that keeps its text (none bound when `bound` is false: a
// caller that wants no result), or what the reading threw.
std::string Reply(const std::string& json, bool bound = true) {
  LSP::JsonResult result;
  LSP::xReader reader;
  EXPECT_TRUE(reader.Parse(json)) << reader.Error();
  LSP::ResponseMessage response(bound ? &result : nullptr);
  const std::string thrown = ThrownText([&] { response.Read(reader); });
  if (!thrown.empty()) return "threw: " + thrown;
  return Fields(response.id, response.jsonrpc, response.HaveError(), response.MethodNotFound(), response.error.code,
                response.ErrorMessage(), result.json);
}

TEST(Envelope, RequestsAndNotificationsInWireOrderAndRepliesReadIntoTheCallersResult) {
  LSP::TextDocumentPositionParams params;
  params.textDocument.uri = "file:///a.c";
  params.position = LSP::Position(3, 7);
  LSP::RequestMessage hover("textDocument/hover", &params), shutdown("shutdown", nullptr), nameless("", nullptr);
  LSP::NotificationMessage exit("exit", nullptr);
  LSP::CancelParams cancel(12);
  LSP::NotificationMessage cancelRequest("$/cancelRequest", &cancel);
  LSP::MessageBase base;
  const auto id = [](const LSP::RequestMessage& request) { return std::to_string(request.id); };
  CheckRows({
      {"request", hover.ToJSON(),
       R"({"jsonrpc":"2.0","id":)" + id(hover) +
           R"(,"method":"textDocument/hover","params":{"textDocument":)"
           R"({"uri":"file:///a.c"},"position":{"line":3,"character":7}}})"},
      {"request without params", shutdown.ToJSON(),
       R"({"jsonrpc":"2.0","id":)" + id(shutdown) + R"(,"method":"shutdown"})"},
      {"request without method", nameless.ToJSON(), R"({"jsonrpc":"2.0","id":)" + id(nameless) + "}"},
      {"notification", exit.ToJSON(), R"({"jsonrpc":"2.0","method":"exit"})"},
      {"notification with params", cancelRequest.ToJSON(),
       R"({"jsonrpc":"2.0","method":"$/cancelRequest","params":{"id":12}})"},
      {"bare message", base.ToJSON(), ""},
      // The transport waits for an answer to requests only.
      {"which is a request", Fields(hover.IsRequest(), exit.IsRequest(), base.IsRequest()), "1|0|0"},
      {"reply with a result", Reply(R"({"jsonrpc":"2.0","id":4,"result":{"text":"hi"}})"),
       "4|2.0|0|0|0||{\"text\":\"hi\"}"},
      {"reply: id as text, null result", Reply(R"({"jsonrpc":"2.0","id":"12","result":null})"), "12|2.0|0|0|0||"},
      {"reply: method not found",
       Reply(R"({"jsonrpc":"2.0","id":3,"error":{"code":-32601,"message":"Unhandled method x"}})"),
       "3|2.0|1|1|-32601|Unhandled method x|"},
      {"reply: error without code", Reply(R"({"jsonrpc":"2.0","id":3,"error":{"message":"boom"}})"),
       "3|2.0|1|0|-1|boom|"},
      {"reply: a notification", Reply(R"({"jsonrpc":"2.0","method":"window/logMessage","params":{}})"),
       "-1|2.0|0|0|0||"},
      {"reply: id not a number", Reply(R"({"id":"x1"})"), "threw: invalid stoi argument"},
      {"reply: id null", Reply(R"({"id":null})"), "threw: Expecting a 'int' JSON object but found 'null' JSON object."},
      {"reply: no result bound", Reply(R"({"id":1,"result":{"text":"no result object bound"}})", false), "1||0|0|0||"},
  });
}

TEST(Envelope, RequestIdsAreConsecutiveUniqueUnderConcurrencyAndNotForNotifications) {
  constexpr int kThreads = 4;
  constexpr int kEach = 5000;
  std::vector<std::vector<int>> ids(kThreads);
  std::vector<std::thread> threads;
  for (int t = 0; t < kThreads; ++t)
    threads.emplace_back([&ids, t] {
      for (int i = 0; i < kEach; ++i) {
        ids[t].push_back(LSP::RequestMessage("m", nullptr).id);
        LSP::NotificationMessage between("n", nullptr);
      }
    });
  for (std::thread& thread : threads) thread.join();
  std::set<int> all;
  for (const std::vector<int>& some : ids) {
    EXPECT_TRUE(std::is_sorted(some.begin(), some.end()));
    all.insert(some.begin(), some.end());
  }
  EXPECT_GE(*all.begin(), 1);
  EXPECT_EQ(all.size(), static_cast<size_t>(kThreads * kEach));
  EXPECT_EQ(*all.rbegin() - *all.begin() + 1, kThreads * kEach);
}

}  // namespace
