// Answers to the requests a language server sends its client. Servers stall until they
// get one, so every request is answered, if only with "Method not found".
#pragma once

#include <string>

#include "vexil/json/json.h"

namespace vexil {

// Whether `message` (a parsed object with a "method") waits for an answer.
bool IsServerRequest(const LSP::xObject& message);

// The JSON text of our response to `request`, carrying its id back unchanged.
std::string AnswerServerRequest(const LSP::xObject& request);

}  // namespace vexil
