// A reply text parsed by xReader, judged as a parse of its counted bytes judges it, and
// read into every result class, as the transport does with a server's answer; and read as
// a completion reply from the parser's events, which must agree with the document read; the
// plain reader must agree with RapidJSON's wherever it takes the text.
#include <cstdint>
#include <string>

#include "json/rapidjson.h"
#include "plain_events.h"
#include "read_results.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  const std::string text(reinterpret_cast<const char*>(data), size);
  LSP::xReader reader;
  const bool parsed = reader.Parse(text);
  // The reader parses the text as a C string, for speed: it must judge every text as a
  // parse of the counted bytes does.
  LSP::JsonDocument counted;
  counted.Parse<rapidjson::kParseIterativeFlag>(text.c_str(), text.size());
  if (parsed == counted.HasParseError() ||
      (!parsed && reader.Error().rfind(rapidjson::GetParseError_En(counted.GetParseError()), 0) != 0))
    __builtin_trap();
  if (parsed) fuzz::ReadIntoEveryResult(reader);
  // A completion reply read from the parser's events holds what the document read holds,
  // or is left to it untouched; the id it awaits is the text's own when it has one.
  const LSP::JsonValue& root = reader.Root().Value();
  const int id = parsed && root.IsObject() && root.HasMember("id") && root["id"].IsInt() ? root["id"].GetInt() : 1;
  const std::string both = fuzz::ReadBothWays(text, id);
  if (both != "taken" && both != "declined") __builtin_trap();
  const std::string plain = fuzz::PlainAgrees(text);
  if (plain != "read" && plain != "declined") __builtin_trap();
  return 0;
}
