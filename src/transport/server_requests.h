// Answers to the requests a language server sends its client. Servers stall until they
// get one, so every request is answered, if only with "Method not found".
#pragma once

#include <string>
#include <vector>

#include "vexil/json/json.h"
#include "vexil/protocol/structures.h"

namespace vexil {

// Whether `message` (a parsed object with a "method") waits for an answer.
bool IsServerRequest(const LSP::xObject& message);

// Whether the library has an answer of its own for requests of `method` (anything else
// gets "Method not found").
bool HasOwnAnswer(const std::string& method);

// The JSON text of our response to `request`, carrying its id back unchanged;
// "workspace/workspaceFolders" is answered with `folders` (null when there are none). An
// id that is neither a number nor a string gets the JSON-RPC "Invalid Request" error.
std::string AnswerServerRequest(const LSP::xObject& request, std::vector<LSP::WorkspaceFolder>& folders);

}  // namespace vexil
