// A server's standard output, cut at arbitrary places, through everything the client does
// with it: framing, the reader-side answers to server requests and storing of published
// diagnostics, and the matching of each message as the reply to a request, read into
// every result. Deep nesting (inputs up to 1 MiB) must neither crash nor recurse without
// bound, every answer must be valid JSON that carries the request's id back (or null),
// and no message may leave a read error behind.
#include <cstdint>
#include <cstdlib>
#include <string>

#include "chunks.h"
#include "json/rapidjson.h"
#include "read_results.h"
#include "transport/pipe_reader.h"
#include "transport/server.h"

namespace {

// The connection's message handling without a process: nothing is ever launched.
class Connection : public vexil::xServer {
 public:
  Connection() : xServer(xServerStart()) {}
  bool Matches(int id, const std::string& text) { return HaveId(id, text); }
  // The answer's text, empty when the message needs none.
  std::string AnswerTo(LSP::xReader& message) { return Respond(message).body; }
};

// The output reader fed directly instead of from its pipe.
class Output : public vexil::xPipeReader {
 public:
  Output() : xPipeReader("stdout", Unused()) {}
  using xPipeReader::Consume;

 private:
  static Poco::Pipe& Unused() {
    static Poco::Pipe pipe;
    return pipe;
  }
};

// The answer must parse and carry back a number or string id as it came, anything else as null.
void CheckAnswer(const LSP::xObject& request, const std::string& answer) {
  LSP::xReader parsed;
  if (!parsed.Parse(answer) || !parsed.Root().IsObject()) std::abort();
  const LSP::JsonValue& asked = request.Object("id").Value();
  const LSP::JsonValue& given = parsed.Root().Value()["id"];
  bool echoed = asked.IsNumber() || asked.IsString();
  if (echoed ? !(given == asked) : !given.IsNull()) std::abort();
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  Connection connection;
  Output output;
  output.SetDispatch([&](LSP::xReader& message) {
    std::string answer = connection.AnswerTo(message);
    if (!answer.empty()) CheckAnswer(message.Root(), answer);
  });
  const fuzz::Chunks chunks(data, size);
  for (const fuzz::Chunk& chunk : chunks.Pieces()) output.Consume(chunk.data, chunk.size);
  std::string body;
  while (output.Messages().TryPop(body)) {
    for (int id : {-1, 0, 1}) {
      if (!connection.Matches(id, body)) continue;
      LSP::xReader reply;
      if (reply.Parse(body)) fuzz::ReadIntoEveryResult(reply);
    }
  }
  if (!output.Errors().empty()) std::abort();
  return 0;
}
