// The record with which a host configures one watcher task and the command it runs.
// Its layout is shared with hosts: fields are never reordered.
#pragma once

#include <cstdint>
#include <string>

#include "vexil/export.h"
#include "vexil/host/trace.h"

class VEXIL_API xWatcherOptions {
 public:
  xWatcherOptions();
  ~xWatcherOptions();
  xWatcherOptions(const xWatcherOptions& other);
  xWatcherOptions(xWatcherOptions&& other) noexcept;
  xWatcherOptions& operator=(const xWatcherOptions& other);
  xWatcherOptions& operator=(xWatcherOptions&& other) noexcept;

  TraceCallback trace = nullptr;  // null silences every trace line and notice
  LSP::TraceLevel level = LSP::TraceLevel::Off;
  std::int32_t timeout = 0;  // how long a command may run, in milliseconds; 0 or less means 5000
  bool useCommand = false;   // run `arguments` as one command line through the command interpreter
  std::string executable;    // the program, when not through the interpreter
  std::string directory;     // working directory of the command; empty keeps the host's
  std::string arguments;     // one argument (or command line) with file-name tags such as $FN
  bool disabled = false;     // a disabled task does not watch until Enable
  bool flag = false;         // kept for the host and reported by IsFlagged
};
