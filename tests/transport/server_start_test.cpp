// Starting and closing the fake server on every platform: a missing executable or directory
// and a server that ends at once are failed starts, and the destructor never waits for what
// the server left holding its pipes.
#include <gtest/gtest.h>

#include <chrono>
#include <memory>

#include "transport_test_support.h"

namespace {

using namespace std::chrono_literals;
using namespace transport_test;

// What it wrote is traced first at the messages level; below it, only the failure is.
TEST_F(ServerStart, ProcessThatExitsAtOnceIsAFailedStartWithItsOutput) {
  for (LSP::TraceLevel level : {LSP::TraceLevel::Messages, LSP::TraceLevel::Off}) {
    auto server = FailedStart(FakeStart({"stdout=banner\\n;exit=0"}, 200, level));
    ASSERT_TRUE(server);
    Texts expected = {kFailedStart, kCheckDetails, kHint};
    if (level == LSP::TraceLevel::Messages) expected.insert(expected.begin(), "banner\n");
    EXPECT_EQ(TraceLog::Texts(), expected);
    EXPECT_FALSE(server->HaveErrors());
  }
}

TEST_F(ServerStart, DestructorReturnsPromptlyWhileServerAndGrandchildHoldThePipes) {
  auto server = std::make_unique<vexil::xServer>(FakeStart({"grandchild=0;hang"}));
  ASSERT_TRUE(server->Start());
  const int id = server->Id();
  auto closing = std::chrono::steady_clock::now();
  server.reset();
  EXPECT_LT(std::chrono::steady_clock::now() - closing, 2s);
  EXPECT_TRUE(vexil_test::ProcessExists(id)) << "the destructor never ends the server";
  vexil_test::KillProcess(id);

  // The server is gone but what it left behind keeps the pipes for 20 s more: neither
  // the failed start nor the destructor may wait for it. (The start fails unless a busy
  // machine kept the server past the start's look.)
  auto orphaned = std::make_unique<vexil::xServer>(FakeStart({"grandchild=20000;exit=0"}));
  closing = std::chrono::steady_clock::now();
  orphaned->Start();
  orphaned.reset();
  EXPECT_LT(std::chrono::steady_clock::now() - closing, 2s);
}

// A missing executable or directory: the error, the hint once, the system's reason, and
// the advice to check the details.
TEST_F(ServerStart, MissingExecutableOrDirectoryReportsInOrderWithTheHintOnce) {
  for (const LaunchFailure& failure : LaunchFailures()) {
    SCOPED_TRACE(failure.executable + " in " + failure.directory);
    TraceLog::Clear();
    xServerStart start = FakeStart({}, 200, LSP::TraceLevel::Messages);
    start.executable = failure.executable;
    start.directory = failure.directory;
    vexil::xServer server(start);
    EXPECT_FALSE(server.Start());
    EXPECT_TRUE(server.HaveErrors());
    EXPECT_EQ(server.ErrorMessage(), failure.error);
    EXPECT_EQ(TraceLog::Texts(), (Texts{"Error: " + failure.error + "\n\n", kHint,
                                        "\nError Reason: " + failure.reason + "\n", kFailedStart, kCheckDetails}));
  }
}

}  // namespace
