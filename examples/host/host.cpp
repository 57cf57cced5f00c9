// The smallest complete use of vexil: start clangd, open a file, ask for the hover at a
// position, and end the server. Usage: vexil_host FILE LINE COLUMN (counted from 1).
#include <cstdio>
#include <cstdlib>
#include <filesystem>
#include <fstream>
#include <sstream>

#include <vexil/vexil.h>

static void PrintErrors(TraceType type, const char* title, const char* text) {
  if (std::string(title) == "Error") std::fprintf(stderr, "%s", text);
}

int main(int argc, char** argv) {
  if (argc != 4) {
    std::fprintf(stderr, "usage: vexil_host FILE LINE COLUMN\n");
    return 2;
  }
  // Servers know files by URI, and a URI names an absolute path.
  const std::string path = std::filesystem::absolute(argv[1]).string();
  std::ifstream file(path);
  std::stringstream text;
  text << file.rdbuf();
  if (!file || FileToUri(path.c_str()).empty()) {
    std::fprintf(stderr, "vexil_host: cannot read %s\n", argv[1]);
    return 1;
  }

  xServerStart start;
  start.name = "clangd";
  start.executable = "clangd";
  start.argument1 = "--log=error";
  start.timeout = 5000;
  start.trace = &PrintErrors;
  xLanguageServer* server = Vexil_Start(start);
  if (!server->Start(xServerInitialise())) return 1;

  LSP::DidOpenTextDocumentParams open;
  open.textDocument.uri = FileToUri(path.c_str());
  open.textDocument.languageId = xLanguages().LanguageId("cpp");
  open.textDocument.version = 1;
  open.textDocument.text = text.str();
  server->TextDocument_DidOpen(&open);

  LSP::TextDocumentPositionParams at;
  at.textDocument.uri = open.textDocument.uri;
  at.position = LSP::Position(std::atoi(argv[2]) - 1, std::atoi(argv[3]) - 1);
  LSP::Hover hover = server->TextDocument_Hover(&at);
  std::printf("%s\n", hover.contents.value.c_str());

  server->Shutdown();
  server->Exit();
  return hover.contents.value.empty() ? 1 : 0;
}
