// A completion reply read straight from the parser's events into the model, with no
// document built in between: the list a large project's completion popup waits for.
#pragma once

#include <string>

#include "vexil/protocol/message.h"

namespace LSP {

// Reads `text` into `response` when it is the reply to request `id`, its result goes into
// a CompletionList that does not keep its items' JSON, and it is in the shape servers
// send: "id" before "result", no member twice, every member of its expected type.
// Otherwise returns false with `response` as it was, for the document read, which judges
// every text, to take over. What it reads is exactly what the document read makes of that
// text.
bool ReadCompletionReply(const std::string& text, int id, ResponseMessage& response);

}  // namespace LSP
