// Checking and writing params given as JSON text.
#include "client/json_params.h"

#include "protocol/raw_json.h"

namespace LSP {

bool JsonParams::Parse(const char* json, std::string& error) {
  empty_ = !json || !*json;
  if (empty_) return true;
  if (!ParseJsonText(json, document_, error)) return false;
  empty_ = document_.IsNull();
  // Every method of the protocol takes an object.
  if (empty_ || document_.IsObject()) return true;
  error = "not an object";
  return false;
}

void JsonParams::Write(xWriter& writer) {
  for (const auto& member : document_.GetObject()) writer.Raw(member.name.GetString(), member.value);
}

}  // namespace LSP
