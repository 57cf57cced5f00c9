// Uses the trace records and queue through the shared library alone.
#include <gtest/gtest.h>

#include "vexil/host/trace.h"

TEST(TraceExports, QueueAndLevelNamesAreReachable) {
  xTraceEvent::Write(TraceType::Line, "Error", "message", "detail");
  xTraceEvent event;
  ASSERT_TRUE(xTraceEvent::queue().TryPop(event));
  EXPECT_EQ(event.text, "message\ndetail");
  EXPECT_EQ(TraceToString(LSP::TraceLevel::Verbose), "verbose");
}
