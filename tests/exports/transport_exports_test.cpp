// Uses the server records through the shared library alone: they must be exported
// value types that a host can build, copy and move.
#include <gtest/gtest.h>

#include <utility>

#include "vexil/host/records.h"

TEST(TransportExports, ServerRecordsAreValueTypes) {
  xServerStart start;
  EXPECT_EQ(start.timeout, 0);
  EXPECT_FALSE(start.useCommand);
  EXPECT_EQ(start.trace, nullptr);
  start.executable = "clangd";
  start.argument1 = "--log=error";
  start.name = "cpp";
  xServerStart copy(start);
  EXPECT_EQ(copy.argument1, "--log=error");
  xServerStart moved(std::move(copy));
  EXPECT_EQ(moved.name, "cpp");
  copy = moved;
  copy = copy;
  EXPECT_EQ(copy.executable, "clangd");

  xServerInitialise initialise;
  EXPECT_EQ(initialise.processId, -1);
  EXPECT_TRUE(initialise.workspaceFolders.empty());
  initialise.workspaceFolders.emplace_back("file:///src", "src");
  xServerInitialise other;
  other.workspaceFolders.resize(3);
  other = initialise;
  ASSERT_EQ(other.workspaceFolders.size(), 1u);
  EXPECT_EQ(other.workspaceFolders[0].name, "src");
  xServerInitialise taken(std::move(other));
  EXPECT_EQ(taken.workspaceFolders[0].uri, "file:///src");
}
