// A reply text parsed by xReader and read into every result class, as the transport does
// with a server's answer.
#include <cstdint>
#include <string>

#include "read_results.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
  LSP::xReader reader;
  if (reader.Parse(std::string(reinterpret_cast<const char*>(data), size))) fuzz::ReadIntoEveryResult(reader);
  return 0;
}
