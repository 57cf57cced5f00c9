// Builds the benchmark replies from the recorded clangd data, so their shape (member
// order, nesting, string lengths) is what a real server sends.
#include "bench_replies.h"

#include <cstdlib>
#include <fstream>
#include <sstream>
#include <stdexcept>

#include "json/rapidjson.h"
#include "vexil_test/support.h"

namespace bench {
namespace {

std::string ReadDataFile(const std::string& relative) {
  std::ifstream file(std::string(VEXIL_TEST_DATA) + "/" + relative, std::ios::binary);
  if (!file) throw std::runtime_error("missing test data " + relative);
  std::ostringstream text;
  text << file.rdbuf();
  return text.str();
}

std::string Serialize(const LSP::JsonValue& value) {
  rapidjson::StringBuffer buffer;
  rapidjson::Writer<rapidjson::StringBuffer> writer(buffer);
  value.Accept(writer);
  return buffer.GetString();
}

// The "result" member of a recorded reply, as compact JSON.
std::string RecordedResult(const std::string& relative) {
  LSP::JsonDocument document;
  const std::string text = ReadDataFile(relative);
  document.Parse(text.c_str(), text.size());
  if (document.HasParseError() || !document.HasMember("result")) throw std::runtime_error("bad reply " + relative);
  return Serialize(document["result"]);
}

// The recorded items with each label made unique, so no two items are the same text.
std::string VariedItems(const std::string& items, int round) {
  std::string varied;
  const std::string key = "\"label\":\"";
  std::size_t from = 0;
  for (std::size_t at; (at = items.find(key, from)) != std::string::npos; from = at + key.size()) {
    varied.append(items, from, at + key.size() - from);
    varied += "v" + std::to_string(round) + "_";
  }
  return varied + items.substr(from);
}

}  // namespace

std::string HoverResult() { return RecordedResult("replies/clangd/hover.json"); }

std::string CompletionResult(std::size_t bytes) {
  const std::string list = RecordedResult("replies/clangd/completion.json");
  const std::string open = "\"items\":[";
  const std::size_t itemsBegin = list.find(open) + open.size();
  const std::size_t itemsEnd = list.rfind(']');
  const std::string items = list.substr(itemsBegin, itemsEnd - itemsBegin);
  std::string grown = list.substr(0, itemsBegin);
  for (int round = 0; grown.size() < bytes; ++round) grown += (round ? "," : "") + VariedItems(items, round);
  return grown + list.substr(itemsEnd);
}

std::string Reply(int id, const std::string& result) {
  return "{\"jsonrpc\":\"2.0\",\"id\":" + std::to_string(id) + ",\"result\":" + result + "}";
}

std::string TemporaryFile(const std::string& name, const std::string& text) {
  // Removed with everything in it when the process ends.
  static const vexil_test::TempDirectory directory;
  const std::string path = directory / name;
  std::ofstream(path, std::ios::binary) << text;
  return path;
}

const std::string& HoverFile() {
  static const std::string path = TemporaryFile("hover.json", HoverResult());
  return path;
}

const std::string& CompletionFile() {
  static const std::string path = TemporaryFile("completion.json", CompletionResult(1u << 20));
  return path;
}

}  // namespace bench
