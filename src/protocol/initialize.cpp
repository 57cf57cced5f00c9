// Writing of the initialize params, with the host's options embedded as JSON, and reading
// of the initialize result. Member order is fixed; empty texts and lists are left out.
#include "vexil/protocol/initialize.h"

#include "json/json_depth.h"
#include "json/rapidjson.h"
#include "protocol/json_arrays.h"
#include "protocol/raw_json.h"

namespace LSP {

void InitializationOptions::Write(xWriter& writer) {
  if (text.empty()) return;
  JsonDocument document;
  document.Parse<rapidjson::kParseIterativeFlag>(text.c_str(), text.size());
  // A host's faulty configuration must not keep the server from starting: it is dropped,
  // and so is one nested too deep to be written out safely.
  if (document.HasParseError() || !document.IsObject()) return;
  auto member = document.FindMember(Name());
  if (member != document.MemberEnd() && NestedWithin(member->value, kNestingLimit)) writer.Raw(Name(), member->value);
}

void ClientInfo::Write(xWriter& writer) {
  writer.String("name", name);
  writer.String("version", version);
}

InitializeParams::InitializeParams(int processId, const std::string& rootUri, TraceLevel trace,
                                   const InitializationOptions& options)
    : processId(processId), rootUri(rootUri), initializationOptions(options), trace(TraceToString(trace)) {}

void InitializeParams::Write(xWriter& writer) {
  writer.Int("processId", processId);
  writer.String("rootUri", rootUri);
  initializationOptions.Write(writer);
  writer.Object(capabilities, true);
  writer.String("trace", trace);
  if (!workspaceFolders.empty()) WriteArray(writer, "workspaceFolders", workspaceFolders);
}

void InitializeResult::Read(const xObject& value) {
  xObject read = value.Object("capabilities");
  // Kept before the model reads it: a reading that fails still leaves the text.
  capabilitiesJson = NestedWithin(read.Value(), kNestingLimit) ? RawJsonText(read) : "";
  capabilities.Read(read);
}

}  // namespace LSP
