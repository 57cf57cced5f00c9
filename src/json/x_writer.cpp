// Compact JSON output for the protocol model: keyed members written in call order,
// empty optional strings left out together with their keys.
#include "json/json_errors.h"
#include "json/rapidjson.h"

namespace LSP {

struct xWriter::Impl {
  Impl() : buffer(nullptr, 256), writer(buffer) {}
  rapidjson::StringBuffer buffer;
  rapidjson::Writer<rapidjson::StringBuffer> writer;
};

xWriter::xWriter() : impl_(new Impl) {}
xWriter::~xWriter() = default;

void xWriter::Key(const char* name) {
  RequireName(name);
  impl_->writer.Key(name);
}

void xWriter::StartObject() { impl_->writer.StartObject(); }
void xWriter::EndObject() { impl_->writer.EndObject(); }

void xWriter::Object(const char* name, JsonObject& value) {
  Key(name);
  Object(value, false);
}

void xWriter::Object(JsonObject& value, bool keyed) {
  if (keyed) Key(value.Name());
  StartObject();
  value.Write(*this);
  EndObject();
}

void xWriter::String(const char* name, const std::string& value) {
  if (value.empty()) return;
  RequiredString(name, value);
}

void xWriter::RequiredString(const char* name, const std::string& value) {
  Key(name);
  String(value);
}

void xWriter::String(const std::string& value) {
  impl_->writer.String(value.data(), static_cast<rapidjson::SizeType>(value.size()));
}

void xWriter::Bool(const char* name, bool value) {
  Key(name);
  impl_->writer.Bool(value);
}

void xWriter::Int(const char* name, int value) {
  Key(name);
  impl_->writer.Int(value);
}

void xWriter::UInt(const char* name, unsigned value) {
  Key(name);
  impl_->writer.Uint(value);
}

void xWriter::Int64(const char* name, std::int64_t value) {
  Key(name);
  impl_->writer.Int64(value);
}

void xWriter::UInt64(const char* name, std::uint64_t value) {
  Key(name);
  impl_->writer.Uint64(value);
}

void xWriter::Null(const char* name) {
  Key(name);
  impl_->writer.Null();
}

void xWriter::StartArray(const char* name) {
  Key(name);
  impl_->writer.StartArray();
}

void xWriter::EndArray() { impl_->writer.EndArray(); }

void xWriter::Integers(const char* name, const std::vector<int>& values) {
  StartArray(name);
  for (int value : values) impl_->writer.Int(value);
  EndArray();
}

void xWriter::Strings(const char* name, const std::vector<std::string>& values) {
  StartArray(name);
  for (const std::string& value : values) String(value);
  EndArray();
}

void xWriter::Raw(const char* name, const JsonValue& value) {
  Key(name);
  value.Accept(impl_->writer);
}

void xWriter::RawValue(const std::string& json, JsonType type) {
  impl_->writer.RawValue(json.c_str(), json.size(), static_cast<rapidjson::Type>(type));
}

std::string xWriter::GetString() const {
  return std::string(impl_->buffer.GetString(), impl_->buffer.GetSize());
}

}  // namespace LSP
