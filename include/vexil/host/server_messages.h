// What a server says on its own, handed to the host: the handler a host sets on a
// connection to hear the server's notifications, requests and exit.
#pragma once

// Called for each notification of the server, each server request the host is to answer
// (then `idJson` is the request's id as JSON text, for Reply or ReplyError; null for a
// notification), and the server's exit: method "exit", params {"status":N}. `paramsJson`
// is the params as JSON text, "null" when there were none. The texts live for the call only.
// Calls come one at a time, in the order the server sent, on a thread of the connection
// that is neither the host's nor the one reading the server, with no lock of the library
// held: the handler may call Reply, ReplyError and Cancel. It must not wait for a thread
// that is calling Exit: Exit waits at most a second for a call in progress to return.
using xMessageHandler = void (*)(void* userData, const char* method, const char* idJson, const char* paramsJson);
