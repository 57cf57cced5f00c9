// Writing and reading of the JSON-RPC envelope, and the process-wide request id counter.
// Member order is fixed: "jsonrpc", "id", "method", then the params under their name.
#include "vexil/protocol/message.h"

#include <atomic>

namespace LSP {
namespace {

std::atomic<int> lastRequestId{0};

void WriteParams(xWriter& writer, Params* params) {
  if (params) writer.Object(params->Name(), *params);
}

}  // namespace

void MessageBase::Read(const xObject& value) { jsonrpc = value.String("jsonrpc"); }
void MessageBase::Write(xWriter& writer) { writer.String("jsonrpc", jsonrpc); }

RequestMessage::RequestMessage(const char* method, Params* params)
    : id(++lastRequestId), method(method ? method : ""), params(params) {}

void RequestMessage::Write(xWriter& writer) {
  MessageBase::Write(writer);
  writer.Int("id", id);
  writer.String("method", method);
  WriteParams(writer, params);
}

std::string RequestMessage::ToJSON() { return ToJsonText(*this); }

NotificationMessage::NotificationMessage(const char* method, Params* params)
    : method(method ? method : ""), params(params) {}

void NotificationMessage::Write(xWriter& writer) {
  MessageBase::Write(writer);
  writer.String("method", method);
  WriteParams(writer, params);
}

std::string NotificationMessage::ToJSON() { return ToJsonText(*this); }

void ResponseError::Read(const xObject& value) {
  code = value.Int("code");
  message = value.String("message");
}

void ResponseError::Write(xWriter& writer) {
  writer.Int("code", code);
  writer.String("message", message);
}

void ResponseMessage::Read(xReader& reader) { Read(reader.Root()); }

void ResponseMessage::Read(const xObject& value) {
  MessageBase::Read(value);
  id = value.HasObject("id") ? value.Object("id").AsInt() : -1;
  if (value.HasObject("error")) error.Read(value.Object("error"));
  if (result && value.HasObject("result")) {
    xObject content = value.Object("result");
    if (!content.IsNull()) result->Read(content);
  }
}

void CancelParams::Read(const xObject& value) { id = value.Int("id"); }
void CancelParams::Write(xWriter& writer) { writer.Int("id", id); }

}  // namespace LSP
