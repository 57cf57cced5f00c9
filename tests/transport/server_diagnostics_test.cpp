// Publications stored as they arrive: while the host waits for nothing, only the newest
// per document, cleared by empty lists, bounded in memory, and dropped when malformed.
#include <gtest/gtest.h>

#include <string>

#include "../protocol/reply_helpers.h"
#include "transport_test_support.h"

namespace {

using namespace std::chrono_literals;
using namespace transport_test;

std::string Doc(int n) { return "file:///fake/doc" + std::to_string(n) + ".cpp"; }

// Makes the fake server publish at once; the host then waits for no reply.
void Publish(vexil::xServer& server, const std::string& params) { Notify(server, "fake/publish", params); }

bool ReachesVersion(vexil::xServer& server, int version) {
  return WaitFor([&] { return server.Diagnostics().Version() == version; }, 60s);
}

using ServerDiagnostics = FakeServerTest;

TEST_F(ServerDiagnostics, IdlePublicationsAreStoredNewestPerDocumentStillQueuedAndDroppedWhenMalformed) {
  auto server = Started();
  Publish(*server, R"({"documents":2,"count":4})");
  ASSERT_TRUE(ReachesVersion(*server, 4));

  EXPECT_EQ(server->Diagnostics().Of(Doc(0)).size(), 1u);  // two publications each, the newest kept
  auto second = server->Diagnostics().Of(Doc(1));
  ASSERT_EQ(second.size(), 1u);
  EXPECT_EQ(vexil_test::Fields(second[0].message, second[0].range.start.line, second[0].severity, second[0].code,
                               second[0].codeText, second[0].source),
            "pass 1|1|2|-1|fake1|fake");
  EXPECT_TRUE(server->Diagnostics().Of("file:///fake/never.cpp").empty());

  // The queue is untouched: the next request still passes over the four publications.
  EXPECT_TRUE(Ask(*server, "fake/echo").read);
  int ignored = 0;
  for (const std::string& text : TraceLog::Texts("Message")) {
    ignored += text.rfind("Ignoring Reply: ", 0) == 0 && text.find("publishDiagnostics") != std::string::npos;
  }
  EXPECT_EQ(ignored, 4);

  Publish(*server, R"({"documents":2,"count":2,"empty":true})");
  ASSERT_TRUE(ReachesVersion(*server, 6));
  EXPECT_TRUE(server->Diagnostics().Of(Doc(0)).empty());
  EXPECT_TRUE(server->Diagnostics().Of(Doc(1)).empty());

  // A malformed publication is dropped without failing the reader.
  std::string bad = R"({"jsonrpc":"2.0","method":"textDocument/publishDiagnostics","params":{"uri":"file:///b.cpp","diagnostics":{}}})";
  std::string garbage = "Content-Length: " + std::to_string(bad.size()) + "\\r\\n\\r\\n" + bad;
  std::string escaped;
  for (char c : garbage) escaped += c == '"' ? std::string("\\\"") : std::string(1, c);

  EXPECT_TRUE(Ask(*server, "fake/echo", "{\"garbage\":\"" + escaped + "\"}").read);
  EXPECT_EQ(server->Diagnostics().Version(), 6);
  EXPECT_EQ(TraceLog::Count("Diagnostics Error: Expecting a array JSON object but found 3 JSON object .\n"), 1);

  TraceLog::Clear();
  Ask(*server, "fake/echo");
  EXPECT_FALSE(TraceLog::Contains("Write Error"));
}

TEST_F(ServerDiagnostics, PastTheLimitTheDocumentsLongestWithoutAPublicationAreDropped) {
  auto server = Started();
  const std::string twelveMiB = R"(,"count":1,"padding":12582912})";
  Publish(*server, R"({"documents":2,"count":2,"padding":12582912})");
  Publish(*server, R"({"from":0)" + twelveMiB);  // the first document is the newest again
  Publish(*server, R"({"from":2)" + twelveMiB);  // 36 MiB: the second one gives way
  ASSERT_TRUE(ReachesVersion(*server, 4));
  EXPECT_TRUE(server->Diagnostics().Of(Doc(1)).empty());
  EXPECT_EQ(server->Diagnostics().Of(Doc(0)).size(), 1u);
  EXPECT_EQ(server->Diagnostics().Of(Doc(2)).size(), 1u);
  EXPECT_LE(server->Diagnostics().Bytes(), vexil::DiagnosticsStore::kByteLimit);
  Publish(*server, R"({"count":0})");  // the reader's lines are traced by the host's next exchange
  EXPECT_EQ(TraceLog::Count("Diagnostics Dropped: " + Doc(1) + "\n"), 1);
  EXPECT_FALSE(TraceLog::Contains("Diagnostics Dropped: " + Doc(0)));
}

}  // namespace
