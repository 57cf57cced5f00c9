// Trace records, the process-wide queue under concurrent writers, and the level rules
// and bounded formatting every subsystem reports through.
#include <gtest/gtest.h>

#include <string>
#include <thread>
#include <vector>

#include "host/trace_line.h"
#include "vexil/host/trace.h"
#include "vexil_test/trace_log.h"

using vexil_test::TraceLog;

TEST(TraceEvent, DetailFollowsMessageAfterOneLineFeedOnlyWhenNotEmpty) {
  EXPECT_EQ(xTraceEvent(TraceType::Line, "Error", "boom", nullptr).text, "boom");
  EXPECT_EQ(xTraceEvent(TraceType::Line, "Error", "boom", "").text, "boom");
  EXPECT_EQ(xTraceEvent(TraceType::Notice, "task", "boom", "why").text, "boom\nwhy");
}

TEST(TraceQueue, KeepsEveryWritersOrderUnderConcurrentWriters) {
  xTraceEvent event;  // what earlier tests left in the queue goes first
  while (xTraceEvent::queue().TryPop(event)) {
  }
  constexpr int kWriters = 4;
  constexpr int kLinesEach = 2000;
  std::vector<std::thread> writers;
  for (int w = 0; w < kWriters; ++w) {
    writers.emplace_back([w] {
      for (int i = 0; i < kLinesEach; ++i)
        xTraceEvent::Write(TraceType::Line, std::to_string(w).c_str(), std::to_string(i).c_str(), nullptr);
    });
  }
  // The host drains while the writers are still busy, waiting when the queue runs dry.
  std::vector<int> next(kWriters, 0);
  for (int taken = 0; taken < kWriters * kLinesEach; ++taken) {
    ASSERT_TRUE(xTraceEvent::queue().WaitPop(event, std::chrono::seconds(30)));
    int writer = std::stoi(event.title);
    EXPECT_EQ(std::stoi(event.text), next[writer]) << "writer " << writer << " out of order";
    ++next[writer];
  }
  for (std::thread& writer : writers) writer.join();
  EXPECT_TRUE(xTraceEvent::queue().Empty());
  // Silence times out; the untimed wait wakes for a late writer.
  EXPECT_FALSE(xTraceEvent::queue().WaitPop(event, std::chrono::milliseconds(1)));
  std::thread late([] { xTraceEvent::Write(TraceType::Line, "Message", "late", nullptr); });
  EXPECT_EQ(xTraceEvent::queue().WaitPop().text, "late");
  late.join();
}

// Each level by its protocol name, and the titles it lets through.
TEST(Tracer, TitlesFollowTheLevelRules) {
  struct Case {
    LSP::TraceLevel level;
    const char* name;
    std::vector<std::string> titles;
  } cases[] = {
      {LSP::TraceLevel::Off, "off", {"Error"}},
      {LSP::TraceLevel::Messages, "messages", {"Message", "Error"}},
      {LSP::TraceLevel::Verbose, "verbose", {"Verbose", "Message", "Error"}},
  };
  EXPECT_EQ(TraceToString(static_cast<LSP::TraceLevel>(3)), "");
  EXPECT_EQ(TraceToString(static_cast<LSP::TraceLevel>(-1)), "");
  for (const Case& c : cases) {
    EXPECT_EQ(TraceToString(c.level), c.name);
    TraceLog::Clear();
    vexil::Tracer tracer(TraceLog::Callback, c.level);
    tracer.Verbose("v %d\n", 1);
    tracer.Message("m %s\n", "x");
    tracer.Error("e\n\n");
    std::vector<std::string> titles;
    for (const vexil_test::TraceLine& line : TraceLog::Lines()) {
      titles.push_back(line.title);
      EXPECT_EQ(line.type, TraceType::Line);
    }
    EXPECT_EQ(titles, c.titles) << "level " << static_cast<int>(c.level);
  }
  TraceLog::Clear();
  vexil::Tracer silent(nullptr, LSP::TraceLevel::Verbose);
  silent.Error("nothing\n");
  silent.Text(TraceType::Notice, "task", "nothing");
  EXPECT_FALSE(silent.Verbose());
  EXPECT_TRUE(TraceLog::Lines().empty());
}

TEST(Tracer, LinesAreCutToTheBufferButTextPassesWhole) {
  TraceLog::Clear();
  std::string longText(10000, 'x');
  vexil::Tracer tracer(TraceLog::Callback, LSP::TraceLevel::Off);
  tracer.Error("%s\n", longText.c_str());
  tracer.Text(TraceType::Line, "Message", longText.c_str());
  vexil::TraceFormatted(TraceLog::Callback, TraceType::Line, "Error", 512, "Watcher: %lld no longer operating.\n%s",
                        static_cast<long long>(7), longText.c_str());
  const std::vector<std::string> texts = TraceLog::Texts();
  ASSERT_EQ(texts.size(), 3u);
  EXPECT_EQ(texts[0], std::string(4095, 'x'));
  EXPECT_EQ(texts[1], longText);
  EXPECT_EQ(texts[2].size(), 511u);
  EXPECT_EQ(texts[2].rfind("Watcher: 7 no longer operating.\n", 0), 0u);
}
