// What a language server says on its own, shown on stderr while `vexil lsp` runs: its
// messages and log lines one line each, and its progress as one line updated in place on a
// terminal (a line per report elsewhere).
#pragma once

namespace cli {

// The connection's message handler; `user` is the Session, whose server it answers when
// the server asks to create a progress token or to apply an edit.
void ShowServerMessage(void* user, const char* method, const char* idJson, const char* paramsJson);
// Clears a progress line left on the terminal.
void EndProgressLine();

}  // namespace cli
