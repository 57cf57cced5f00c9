// The readers over real pipes and the queue behind them: queueing, end of file, stopping
// while the writer stays silent, the dispatch hook, one big body, bounded writes, and the
// bounds on what the queues hold (of bodies or of error lines) while nobody takes.
#include <gtest/gtest.h>

#include <atomic>
#include <chrono>
#include <string>
#include <thread>
#include <vector>

#include "transport/message_queue.h"
#include "transport/pipe_io.h"
#include "transport/pipe_reader.h"
#include "transport/reader_thread.h"
#include "transport_test_support.h"

namespace {

using namespace std::chrono_literals;
using vexil::MessageQueue;
using vexil_test::Frame;

void Send(const Poco::Pipe& pipe, const std::string& bytes) {
  ASSERT_EQ(vexil::WriteAll(pipe, bytes.data(), bytes.size(), std::chrono::steady_clock::now() + 60s), vexil::PipeWrite::Written);
}

// A reader over a fresh pipe, running on its own thread; stopped and joined at the end.
template <typename Reader>
struct RunningReader {
  template <typename... Name>
  explicit RunningReader(Name... name) : reader(name..., pipe) {
    thread.Start(reader);
  }
  ~RunningReader() { reader.Stop(); }
  // Writes `bytes` (the reader drains the pipe meanwhile), closes the pipe and waits
  // until the reader has taken all of it.
  void SendAndClose(const std::string& bytes) {
    Send(pipe, bytes);
    pipe.close(Poco::Pipe::CLOSE_WRITE);
    thread.Join();
  }

  Poco::Pipe pipe;
  Reader reader;
  vexil::ReaderThread thread;
};

// The next item, or nothing once the reader has finished when `expected` says so.
std::string Pop(vexil::xPipeReader& reader, MessageQueue::Wait expected = MessageQueue::Wait::Taken) {
  std::string item;
  EXPECT_EQ(reader.Messages().WaitPop(item, 10s), expected);
  return item;
}

// A queue that nobody took from holds more than half its bound and no more, and its last
// item is the newest one sent.
void ExpectNewestWithin(MessageQueue& queue, std::size_t limit, const std::string& newest) {
  EXPECT_LE(queue.Bytes(), limit);
  EXPECT_GT(queue.Bytes(), limit / 2);
  std::string item;
  while (queue.TryPop(item) && queue.Size() > 0) {
  }
  EXPECT_EQ(item, newest);
}

TEST(PipeReader, QueuesBodiesInOrderWhateverTheirSizeAndFinishesAtEndOfFile) {
  RunningReader<vexil::xPipeReader> running("stdout");
  const std::string big = "\"" + std::string(16u << 20, 'y') + "\"";
  std::thread writer([&] {
    // Half a body at the end is dropped; the stray bytes before it are output.
    running.SendAndClose("banner\n" + Frame(R"({"id":1})") + Frame(big) + Frame("{}") + "stray " +
                         "Content-Length: 10\r\n\r\n{\"id\"");
  });
  EXPECT_EQ(Pop(running.reader), R"({"id":1})");
  const std::string first = Pop(running.reader);
  EXPECT_TRUE(first == big) << "got " << first.size() << " bytes";
  EXPECT_EQ(Pop(running.reader), "{}");
  Pop(running.reader, MessageQueue::Wait::Finished);
  writer.join();
  EXPECT_EQ(running.reader.TakeOutput(), "stray Content-Length: ");
  EXPECT_EQ(running.reader.Errors(), "");
}

TEST(PipeReader, StopEndsAReaderWhoseWriterStaysOpenAndSilent) {
  RunningReader<vexil::xPipeReader> running("stdout");
  Send(running.pipe, "ready");  // once it is taken, the reader is in its loop
  ASSERT_TRUE(transport_test::WaitFor([&] { return running.reader.TakeOutput() == "ready"; }));
  auto stopped = std::chrono::steady_clock::now();
  running.reader.Stop();
  running.thread.Join();  // a blocking read would hang here for good
  EXPECT_LT(std::chrono::steady_clock::now() - stopped, 2s);
  Pop(running.reader, MessageQueue::Wait::Finished);
}

TEST(PipeReader, DispatchSeesOnlyMessagesThatNameAMethodAndEverythingIsQueued) {
  Poco::Pipe pipe;
  vexil::xPipeReader reader("stdout", pipe);
  std::vector<std::string> seen;  // written on the reader's thread, read after the join
  reader.SetDispatch([&](LSP::xReader& message) {
    seen.push_back(message.Root().String("method"));
    if (seen.back() == "fake/fail") throw std::runtime_error(std::string(100, 'e') + std::to_string(seen.size()));
  });
  vexil::ReaderThread thread;  // the hook must be set before the thread starts
  thread.Start(reader);
  const std::vector<std::string> bodies = {
      R"({"jsonrpc":"2.0","method":"window/logMessage","params":{}})",
      R"({"jsonrpc":"2.0","id":0,"method":"workspace/configuration","params":{}})",
      R"({"params":{"hh":"method\"h"},"method" :"late/method"})",
      R"({"jsonrpc":"2.0","id":3,"result":{"text":"\"method\""}})",
      R"(not json "method")",
  };
  for (const std::string& body : bodies) Send(pipe, Frame(body));
  for (const std::string& body : bodies) EXPECT_EQ(Pop(reader), body);
  // A failing hook is recorded as a read error; the record keeps its newest lines.
  std::string failures;
  for (int i = 0; i < 1000; ++i) failures += Frame(R"({"jsonrpc":"2.0","method":"fake/fail"})");
  Send(pipe, failures);
  pipe.close(Poco::Pipe::CLOSE_WRITE);
  thread.Join();
  EXPECT_EQ(std::vector<std::string>(seen.begin(), seen.begin() + 3),
            (std::vector<std::string>{"window/logMessage", "workspace/configuration", "late/method"}));
  std::string errors = reader.Errors();
  EXPECT_LE(errors.size(), vexil::xPipeReader::kErrorsLimit);
  EXPECT_GT(errors.size(), vexil::xPipeReader::kErrorsLimit / 2);
  EXPECT_EQ(errors.rfind("Exception: ", 0), 0u);
  EXPECT_EQ(errors.substr(errors.size() - 6), "e1003\n");
}

TEST(PipeReader, QueuesKeepTheirNewestEntriesWithinTheirLimits) {
  // The error reader queues lines as the splitter cuts them, drops an unfinished last one
  // at the end and keeps no stray output.
  RunningReader<vexil::xPipeErrReader> err;
  std::string lines;
  for (int i = 0; lines.size() < 40u << 20; ++i) lines += "I[10:00:00.000] log line " + std::to_string(i) + std::string(60, '.') + "\n";
  err.SendAndClose(lines + "last line\r\nunfinished");
  ExpectNewestWithin(err.reader.Messages(), vexil::xPipeErrReader::kQueueLimit, "last line");
  EXPECT_EQ(err.reader.TakeOutput(), "");

  RunningReader<vexil::xPipeReader> out("stdout");
  const std::string notification = Frame(R"({"jsonrpc":"2.0","method":"$/progress","params":{"value":")" +
                                         std::string(1000, 'p') + R"("}})");
  std::string frames;
  while (frames.size() < 100u << 20) frames += notification;
  out.SendAndClose(frames + Frame(R"({"id":1})"));
  ExpectNewestWithin(out.reader.Messages(), vexil::xPipeReader::kQueueLimit, R"({"id":1})");
}

// The oldest items give way to the newest, the count stays right as items are taken, and
// a lone item larger than the bound is still delivered.
TEST(MessageQueue, KeepsTheNewestItemsWithinItsLimit) {
  constexpr std::size_t kLimit = 10000;
  constexpr int kPushed = 1000;
  auto item = [](int index) { return "item " + std::to_string(index) + std::string(100, '.'); };
  MessageQueue queue(kLimit);
  for (int i = 0; i < kPushed; ++i) queue.Push(item(i));
  const std::size_t kept = queue.Size();
  ASSERT_GT(kept, 10u);
  ASSERT_LT(kept, 100u);
  EXPECT_LE(queue.Bytes(), kLimit);
  EXPECT_GT(queue.Bytes() + MessageQueue::Footprint(item(kPushed)), kLimit);  // full, not merely shrunk
  std::string taken;
  for (std::size_t i = kPushed - kept; i < kPushed; ++i) {
    ASSERT_TRUE(queue.TryPop(taken));
    EXPECT_EQ(taken, item(static_cast<int>(i)));
  }
  EXPECT_EQ(queue.Bytes(), 0u);

  queue.Push(item(1));
  const std::string huge(3 * kLimit, 'h');
  queue.Push(huge);
  EXPECT_EQ(queue.Size(), 1u);
  ASSERT_TRUE(queue.TryPop(taken));
  EXPECT_TRUE(taken == huge);
}

TEST(PipeIo, BoundedWritesEndByTheirCauseWithoutSignallingTheProcess) {
  const std::string big(std::size_t{4} << 20, 'x');  // more than any pipe holds
  struct Row {
    const char* name;
    bool readerGone, stopped;
    std::chrono::milliseconds limit;
    vexil::PipeWrite expected;
  } rows[] = {
      {"reader gone", true, false, 60s, vexil::PipeWrite::Failed},
      {"nobody reads", false, false, 300ms, vexil::PipeWrite::TimedOut},
      {"stop requested", false, true, 60s, vexil::PipeWrite::Stopped},
  };
  for (const Row& row : rows) {
    Poco::Pipe pipe;
    if (row.readerGone) pipe.close(Poco::Pipe::CLOSE_READ);
    std::atomic<bool> stop{row.stopped};
    for (int attempt = 0; attempt < 2; ++attempt) {  // still alive to try twice
      auto begin = std::chrono::steady_clock::now();
      EXPECT_EQ(vexil::WriteAll(pipe, big.data(), big.size(), begin + row.limit, &stop), row.expected) << row.name;
      EXPECT_LT(std::chrono::steady_clock::now() - begin, 30s) << row.name;
    }
  }
}

}  // namespace
