// A reply text parsed by xReader, judged as a parse of its counted bytes judges it, and
// read into every result class, as the transport does with a server's answer.
#include <cstdint>
#include <string>

#include "json/rapidjson.h"
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
  return 0;
}
