// Waiting for the user's interrupt (Ctrl-C) so that a long-running command can end
// cleanly, destroying what it created instead of dying mid-call.
#pragma once

namespace cli {

// Call before any thread is started, so that every thread leaves the interrupt to us.
void PrepareForInterrupt();
// Blocks until the interrupt arrives.
void WaitForInterrupt();

}  // namespace cli
