// Params the host gives as JSON text, for requests and notifications the model has no
// class for. The text is checked before anything is sent.
#pragma once

#include <string>

#include "json/rapidjson.h"
#include "vexil/protocol/message.h"

namespace LSP {

class JsonParams : public Params {
 public:
  // Takes `json`, a JSON object; a null pointer, "" or "null" means no params. False,
  // with the reason in `error`, for anything else.
  bool Parse(const char* json, std::string& error);
  bool Empty() const { return empty_; }
  // The object's members, as the host wrote them.
  void Write(xWriter& writer) override;

 private:
  JsonDocument document_;
  bool empty_ = true;
};

}  // namespace LSP
