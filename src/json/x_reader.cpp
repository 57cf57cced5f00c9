// Parses the text of one message into a document and hands out views of it.
// A failed parse explains itself: the library's English text, the input, and a caret.
#include "json/json_errors.h"
#include "json/rapidjson.h"

namespace LSP {
namespace {

// The library's English texts, each followed by a line feed as the trace shows them.
std::string ParseErrorText(rapidjson::ParseErrorCode code) {
  if (code > rapidjson::kParseErrorUnspecificSyntaxError) return "Unknown error\n.";
  return std::string(rapidjson::GetParseError_En(code)) + "\n";
}

}  // namespace

struct xReader::Document {
  JsonDocument document;
};

xReader::xReader() : document_(new Document) {}
xReader::~xReader() = default;

bool xReader::Parse(const std::string& text) {
  JsonDocument& document = document_->document;
  document.Parse<rapidjson::kParseIterativeFlag>(text.c_str(), text.size());
  if (!document.HasParseError()) {
    error_.clear();
    return true;
  }
  error_ = ParseErrorText(document.GetParseError());
  error_ += "\n\n";
  error_ += text;
  error_ += "\n";
  error_.append(document.GetErrorOffset(), ' ');
  error_ += "^";
  return false;
}

xObject xReader::Root() { return xObject(document_->document); }

xObject xReader::Object(const char* name) {
  RequireName(name);
  const JsonDocument& document = document_->document;
  if (!document.HasMember(name)) ThrowFormatted("Document does not contain '%s' JSON object.", name);
  return xObject(document[name]);
}

}  // namespace LSP
