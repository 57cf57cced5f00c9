// xProcess: one launched child process, shared by the server transport and the watcher
// commands. It launches, answers whether the child still runs, and never ends it.
#pragma once

#include <memory>
#include <string>
#include <vector>

#include <Poco/Pipe.h>

#include "transport/environment.h"

namespace vexil {

class xProcess {
 public:
  xProcess();
  xProcess(const xProcess&) = delete;
  xProcess& operator=(const xProcess&) = delete;
  // Forgets the child without touching it.
  virtual ~xProcess();

  // Launches `executable` with `arguments` in `directory` (the host's own directory when
  // empty; the host's current directory is never changed). Null pipes leave the stream
  // as the host has it; a pipe given must be open, or the launch fails. `out` and `err`
  // may be the same pipe. The child's ends are closed here once the child holds them.
  // Replaces any earlier child, which is abandoned (see Abandon). The child gets the
  // host's environment with `environment` applied; a bare executable name is looked up
  // on the child's PATH (POSIX; Windows looks on the host's).
  // Throws Poco::Exception when the launch fails, with the OS error code left for
  // LastSystemErrorText().
  void Launch(const std::string& executable, const std::vector<std::string>& arguments,
              const std::string& directory, Poco::Pipe* in, Poco::Pipe* out, Poco::Pipe* err,
              const EnvironmentChanges& environment = {});

  // False before a launch and once the child has ended; an error of the query counts as
  // ended. An ended child is reaped here. Safe from any thread, as is Ended.
  bool IsRunning();
  // Whether a launched child has ended, with its exit status: its exit code, 128 plus the
  // signal that ended it (POSIX), or -1 when the system could not tell.
  bool Ended(int& status);
  // The operating system's process id, or -1 before a launch.
  int Id() const;
  // Forgets the child as the destructor does; one that still runs is collected once it
  // ends, so leaving a child running leaves no zombie behind.
  void Abandon();

 private:
  struct Child;
  std::unique_ptr<Child> child_;
};

// The program and switch that run one command line: the executable text of a server
// record becomes the one argument after the switch.
struct CommandInterpreter {
  const char* program;
  const char* runSwitch;
};
CommandInterpreter SystemCommandInterpreter();

// The operating system's text for the error code of the last failing call, followed by
// a line feed; empty when there is no text.
std::string LastSystemErrorText();

}  // namespace vexil
