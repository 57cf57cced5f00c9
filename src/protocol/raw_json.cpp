// Converting between parsed values and their JSON text for the members the model keeps
// verbatim. Text is parsed again only when it is written, which is rare (a resolve, a call).
#include "protocol/raw_json.h"

#include "json/json_depth.h"
#include "json/json_errors.h"

namespace LSP {
namespace {

void Parse(JsonDocument& document, const char* name, const std::string& json) {
  document.Parse(json.c_str(), json.size());
  if (document.HasParseError())
    ThrowFormatted("Invalid JSON for %s: %s", name, rapidjson::GetParseError_En(document.GetParseError()));
}

}  // namespace

bool ParseJsonText(const std::string& json, JsonDocument& document, std::string& error) {
  document.Parse<rapidjson::kParseIterativeFlag>(json.c_str(), json.size());
  if (document.HasParseError()) {
    error = rapidjson::GetParseError_En(document.GetParseError());
  } else if (!NestedWithin(document, kNestingLimit)) {
    error = "nested deeper than " + std::to_string(kNestingLimit) + " levels";
  } else {
    return true;
  }
  return false;
}

std::string RawJsonText(const xObject& value) { return RawJsonTexts().Text(value); }

std::string RawJsonTexts::Text(const xObject& value) {
  if (value.IsNull()) return "";
  buffer_.Clear();
  writer_.Reset(buffer_);
  value.Value().Accept(writer_);
  return std::string(buffer_.GetString(), buffer_.GetSize());
}

void WriteRawJson(xWriter& writer, const char* name, const std::string& json) {
  if (json.empty()) return;
  JsonDocument document;
  Parse(document, name, json);
  writer.Raw(name, document);
}

void WriteRawElement(xWriter& writer, const std::string& json) {
  JsonDocument document;
  Parse(document, "an array element", json);
  if (!document.IsObject()) ThrowFormatted("Invalid JSON for %s: %s", "an array element", "not an object");
  writer.RawValue(json, JsonType::Object);
}

void WriteRawMembers(xWriter& writer, const std::string& json) {
  JsonDocument document;
  Parse(document, "params", json);
  if (!document.IsObject()) ThrowFormatted("Invalid JSON for %s: %s", "params", "not an object");
  for (const auto& member : document.GetObject()) writer.Raw(member.name.GetString(), member.value);
}

}  // namespace LSP
