// What the command-line host needs from its own process: the interrupt (Ctrl-C, SIGTERM)
// taken on a thread of ours, its children ended, how they ended, and the terminal.
#pragma once

#include <string>

namespace cli {

// Call first in main, before any thread is started: every later thread, and the library's,
// leaves interrupts and child ends to the one thread this starts. On an interrupt that
// thread ends every process below ours and, unless the command has ended by itself within a
// few seconds, the whole process with status 128 + the signal.
void WatchProcess();
// 0 until an interrupt arrived, then its signal number (2 for Ctrl-C, 15 for SIGTERM).
int Interrupted();
// Blocks until an interrupt arrives; returns its signal number.
int WaitForInterrupt();
// Called by the platform's side on the interrupt `signal`, on a thread of its own: tells
// every waiter, ends the children, and ends the process unless the command does first.
[[noreturn]] void EndAfterInterrupt(int signal);
// From now on an interrupt leaves the children to the command for the few seconds it has
// to wind up (it shuts its server down rather than have it killed); what is left then ends.
void WindUpChildren();
// Ends every process started below ours (servers, commands and what they started).
void EndChildren();
// How the most recent child to end did ("status 1", "signal 9"); "" when none has ended
// or the platform does not tell.
std::string LastExit();
// Whether standard error is a terminal, where a person waits for the command.
bool ErrorsToTerminal();

}  // namespace cli
