// Collects children that the library stopped watching while they still ran, so that
// each leaves no zombie behind once it ends. POSIX only: Windows keeps no zombies.
#pragma once

#include <sys/types.h>

namespace vexil {

// Hands `pid`, a child of this process that has not been waited for, to a background
// thread that waits for it without blocking anyone. The thread runs only while there is
// a child to collect, and is stopped when the library is unloaded.
void ReapInBackground(pid_t pid);

}  // namespace vexil
