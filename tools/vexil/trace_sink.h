// Where the command-line host sends the library's trace lines: to stderr as far as the
// person asked, each line prefixed with its title. Underneath, every line is read for what
// the host must know: error lines, what the server wrote on its standard error, and signs
// that the program is no language server at all.
#pragma once

#include <string>

#include "vexil/host/trace.h"

namespace cli {

// The callback handed to the library; it may be called from reader threads.
void TraceToStderr(TraceType type, const char* title, const char* text);

// What is printed: nothing (Off), message and error lines (Messages), or every line. The
// library is asked for every line either way. Everything until changed.
void ShowTrace(LSP::TraceLevel level);
// From now on, reads the trace as that of one language server (below); a watcher's
// commands may write what they like.
void ListenForServer();
// The number of error lines seen so far, and one of them (counted from 0) as one line.
int TraceErrors();
std::string TraceError(int index);
// The last lines the server wrote on its standard error, as one line; "" when none.
std::string ServerSaid();
// Whether the program showed it does not speak the protocol: 64 KiB of output without a
// frame, or a request "initialize" of its own (a program that echoes ours). Once seen, the
// program is ended at once, so that nobody waits for its answer.
bool NotAServer();

}  // namespace cli
