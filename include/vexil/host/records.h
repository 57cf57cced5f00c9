// The two records a host fills to describe one language server: how to launch and report
// on it (xServerStart), and what to send in its initialize request (xServerInitialise).
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "vexil/export.h"
#include "vexil/host/trace.h"
#include "vexil/protocol/structures.h"

// How to launch one server and how to report on it. The library copies it.
class VEXIL_API xServerStart {
 public:
  xServerStart();
  ~xServerStart();
  xServerStart(const xServerStart& other);
  xServerStart(xServerStart&& other) noexcept;
  xServerStart& operator=(const xServerStart& other);
  xServerStart& operator=(xServerStart&& other) noexcept;

  TraceCallback trace = nullptr;  // null silences every trace line
  LSP::TraceLevel level = LSP::TraceLevel::Off;
  std::int32_t timeout = 0;  // reply wait in milliseconds; 0 or less means 200
  bool useCommand = false;   // run `executable` through the command interpreter
  std::string executable;
  std::string directory;  // working directory of the server; empty keeps the host's
  std::string argument1;
  std::string argument2;
  std::string argument3;
  std::string argument4;
  std::string argument5;
  std::string argument6;
  std::string argument7;
  std::string name;  // the registry key
};

// What the initialize request tells the server about the host and its workspace.
class VEXIL_API xServerInitialise {
 public:
  xServerInitialise();
  ~xServerInitialise();
  xServerInitialise(const xServerInitialise& other);
  xServerInitialise(xServerInitialise&& other) noexcept;
  xServerInitialise& operator=(const xServerInitialise& other);
  xServerInitialise& operator=(xServerInitialise&& other) noexcept;

  std::int32_t processId = -1;
  std::string rootPath;  // a file system path, sent as a file URI
  std::string options;   // JSON text of the server's initialization options
  std::vector<LSP::WorkspaceFolder> workspaceFolders;
};
