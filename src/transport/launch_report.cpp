// The launch account's lines; the host's panel aligns them on their colons, and hosts
// match the texts (the "Timout" spelling included).
#include "transport/launch_report.h"

namespace vexil {

void TraceLaunchDetails(const Tracer& tracer, const std::string& executable, const std::string& directory,
                        const char* joinedArguments, bool useCommand, int timeout) {
  if (!tracer.Verbose()) return;
  tracer.Verbose(" Executable: %s\n", executable.c_str());
  tracer.Verbose("  Directory: %s\n", directory.c_str());
  tracer.Verbose("  Arguments: %s\n", joinedArguments);
  tracer.Verbose("Use Command: %s\n", useCommand ? "Yes" : "No");
  tracer.Verbose("     Timout: %d (milliseconds)\n\n", timeout);
}

}  // namespace vexil
