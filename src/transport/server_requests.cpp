// What the client answers to server requests: null for progress and registration,
// one null setting per configuration item, and -32601 for anything it does not know.
#include "transport/server_requests.h"

#include "json/rapidjson.h"
#include "protocol/json_arrays.h"
#include "vexil/protocol/message.h"

namespace vexil {
namespace {

constexpr int kMethodNotFound = -32601;
const char* const kInvalidRequest = R"({"jsonrpc":"2.0","id":null,"error":{"code":-32600,"message":"Invalid Request"}})";

// Requests whose answer carries nothing: the client accepts and has nothing to add.
bool AnsweredWithNull(const std::string& method) {
  static const char* const methods[] = {"window/workDoneProgress/create", "client/registerCapability",
                                        "client/unregisterCapability"};
  for (const char* known : methods) {
    if (method == known) return true;
  }
  return false;
}

// The client has no settings of its own: null for each item asked for.
void WriteNullSettings(LSP::xWriter& writer, const LSP::xObject& request) {
  LSP::xObject params = request.Object("params");
  LSP::xObject items = params.IsObject() ? params.Object("items") : LSP::xObject();
  rapidjson::SizeType count = items.IsArray() ? items.Value().Size() : 0;
  writer.StartArray("result");
  for (rapidjson::SizeType i = 0; i < count; ++i) writer.RawValue("null", LSP::JsonType::Null);
  writer.EndArray();
}

}  // namespace

bool HasOwnAnswer(const std::string& method) {
  return AnsweredWithNull(method) || method == "workspace/workspaceFolders" || method == "workspace/configuration";
}

bool IsServerRequest(const LSP::xObject& message) {
  return message.HasObject("id") && !message.Object("id").IsNull();
}

std::string AnswerServerRequest(const LSP::xObject& request, std::vector<LSP::WorkspaceFolder>& folders) {
  // Only a number or a string can be sent back as it came; anything else (an array
  // nested a million levels deep included) is not a request.
  const LSP::JsonValue& id = request.Object("id").Value();
  if (!id.IsNumber() && !id.IsString()) return kInvalidRequest;
  std::string method = request.Object("method").GetString();
  LSP::xWriter writer;
  writer.StartObject();
  writer.String("jsonrpc", "2.0");
  writer.Raw("id", id);
  if (AnsweredWithNull(method) || (method == "workspace/workspaceFolders" && folders.empty())) {
    writer.Null("result");
  } else if (method == "workspace/workspaceFolders") {
    LSP::WriteArray(writer, "result", folders);
  } else if (method == "workspace/configuration") {
    WriteNullSettings(writer, request);
  } else {
    LSP::ResponseError error;
    error.code = kMethodNotFound;
    error.message = "Method not found";
    writer.Object(error.Name(), error);
  }
  writer.EndObject();
  return writer.GetString();
}

}  // namespace vexil
