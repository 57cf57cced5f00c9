// The pipes, readers and input writer of one launch of a server. Every launch gets fresh
// ones, so a relaunch never hands the child pipes that an earlier launch closed.
#pragma once

#include <Poco/Pipe.h>

#include "transport/deferred_trace.h"
#include "transport/input_writer.h"
#include "transport/message_dispatcher.h"
#include "transport/pipe_reader.h"
#include "transport/reader_thread.h"

namespace vexil {

struct ServerStreams {
  ServerStreams(DeferredTrace& trace, const HandlerSlot& handler, MessageDispatcher::ExitCheck ended,
                MessageDispatcher::Unhandled unhandled)
      : outReader("stdout", outPipe),
        errReader(errPipe),
        input(inPipe, trace),
        dispatcher(handler, std::move(ended), std::move(unhandled)) {}
  ServerStreams(const ServerStreams&) = delete;
  ServerStreams& operator=(const ServerStreams&) = delete;
  ~ServerStreams() { Close(); }

  // Once the child holds its ends: the input writer and the dispatcher first, since the
  // output reader may hand them messages at once, then the error reader and the output reader.
  void Start() {
    input.Start();
    dispatcher.Start();
    errThread.Start(errReader);
    outThread.Start(outReader, [this] { dispatcher.OutputEnded(); });
  }
  // The readers end within one poll interval, even while the server keeps its pipes open.
  void StopReaders() {
    outReader.Stop();
    errReader.Stop();
  }
  // Closing the server's input lets a well-behaved server end.
  void CloseInput() { input.Close(); }
  // The readers poll, so they end on their stop flags even when a process that inherited
  // the pipes keeps them open; only then are the reading ends closed.
  void JoinReaders() {
    outThread.Join();
    errThread.Join();
    outPipe.close(Poco::Pipe::CLOSE_READ);
    errPipe.close(Poco::Pipe::CLOSE_READ);
  }
  // The dispatcher goes last: everything the readers queued reaches the host's handler.
  void Close() {
    StopReaders();
    CloseInput();
    JoinReaders();
    dispatcher.Stop();
  }

  Poco::Pipe inPipe;
  Poco::Pipe outPipe;
  Poco::Pipe errPipe;
  xPipeReader outReader;
  xPipeErrReader errReader;
  InputWriter input;
  MessageDispatcher dispatcher;
  ReaderThread outThread;
  ReaderThread errThread;
};

}  // namespace vexil
